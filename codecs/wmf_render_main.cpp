// quillane-wmf-render: plays one Windows metafile through libwmf's gd device and hands back its
// pixels (the exchange is described in metafile_render.h). It limits itself before it reads a byte,
// so a file that makes libwmf draw without end or allocate without bound only ends this process.
// The decoder has already walked the file's records and refused malformed ones.
// clang-format off
#include <libwmf/api.h>
#include <libwmf/gd.h>
// clang-format on
#include <cmath>
#include <cstdint>
#include <vector>

#include "codecs/metafile_render.h"
#include "codecs/render_child.h"

namespace {

using quillane::codecs::metafile_render::Reply;
namespace limits = quillane::codecs::metafile_render;
using namespace quillane::codecs::render_child;

constexpr std::uint32_t kPlaceableKey = 0x9AC6CDD7;
constexpr std::size_t kPlaceableSize = 22;
constexpr unsigned kDotsPerInch = 96;

// libwmf cannot free the gd image it draws into, and the process ends right after drawing:
// keeping the player reachable from here lets it end without a leak checker's complaint.
wmfAPI* gPlayer = nullptr;

// Until the picture's size is known, the CPU allowance is the fixed one.
bool LimitBeforeReading(std::uint64_t maxPixels, std::uint64_t fileSize) {
  return LimitSelf(limits::kCpuSeconds, limits::CpuSeconds(maxPixels) + 1,
                   maxPixels * 4 + fileSize + limits::kSpareAddressSpace);
}

std::uint16_t ReadWord(const std::vector<std::uint8_t>& d, std::size_t at) {
  return static_cast<std::uint16_t>(d[at] | d[at + 1] << 8);
}

// The gd image's pixels, 0xAARRGGBB with gd's 7-bit alpha (127 transparent), as the bytes
// B, G, R, 255: whatever the player left transparent shows the white background. The alpha
// is first widened to 8 bits the way gd's own PNG writer does it.
bool SendPicture(const int* pixels, std::uint32_t width, std::uint32_t height) {
  if (Answer(Reply::kPicture, width, height) != 0) return false;
  std::vector<std::uint8_t> row(static_cast<std::size_t>(width) * 4);
  for (std::uint32_t y = 0; y < height; ++y) {
    const int* source = pixels + static_cast<std::size_t>(y) * width;
    for (std::uint32_t x = 0; x < width; ++x) {
      const auto p = static_cast<std::uint32_t>(source[x]);
      const unsigned gdAlpha = (p >> 24) & 0x7F;
      const unsigned alpha = 255 - ((gdAlpha << 1) + (gdAlpha >> 6));
      const auto over = [alpha](unsigned c) {
        return static_cast<std::uint8_t>((c * alpha + 255 * (255 - alpha) + 127) / 255);
      };
      std::uint8_t* out = &row[static_cast<std::size_t>(x) * 4];
      out[0] = over(p & 0xFF);
      out[1] = over((p >> 8) & 0xFF);
      out[2] = over((p >> 16) & 0xFF);
      out[3] = 255;
    }
    if (!WriteAll(row.data(), row.size())) return false;
  }
  return true;
}

}  // namespace

int main(int argc, char** argv) {
  std::uint64_t maxPixels = 0, fileSize = 0;
  if (argc != 3 || !ParseCount(argv[1], std::uint64_t{1} << 32, maxPixels) ||
      !ParseCount(argv[2], 0x7FFFFFFF, fileSize) || fileSize < kPlaceableSize) {
    return Answer(Reply::kNotStarted);
  }
  if (!LimitBeforeReading(maxPixels, fileSize)) return Answer(Reply::kNotStarted);
  std::vector<std::uint8_t> file(static_cast<std::size_t>(fileSize));
  if (!ReadAll(file)) return Answer(Reply::kNotOpened);
  const bool placeable =
      (ReadWord(file, 0) | static_cast<std::uint32_t>(ReadWord(file, 2)) << 16) == kPlaceableKey;

  wmfAPI_Options options{};
  options.function = wmf_gd_function;
  const unsigned long flags =
      WMF_OPT_FUNCTION | WMF_OPT_IGNORE_NONFATAL | WMF_OPT_NO_ERROR | WMF_OPT_NO_DEBUG;
  if (wmf_api_create(&gPlayer, flags, &options) != wmf_E_None) return Answer(Reply::kNotStarted);
  if (wmf_mem_open(gPlayer, file.data(), static_cast<long>(file.size())) != wmf_E_None) {
    return Answer(Reply::kNotOpened);
  }
  wmfD_Rect bounds{};
  if (wmf_scan(gPlayer, 0, &bounds) != wmf_E_None) return Answer(Reply::kDamaged);
  // The player works in points. A placeable file's frame is its bounding box, with the box's
  // top-left corner as the window origin the file's records set; other files are as large as
  // what they draw.
  if (placeable) {
    const auto frame = [&file](std::size_t at) {
      return static_cast<std::int16_t>(ReadWord(file, at));
    };
    const int unitsPerInch = ReadWord(file, 14);
    if (unitsPerInch == 0) return Answer(Reply::kNoUnitsPerInch);
    const double toPoints = 72.0 / unitsPerInch;
    bounds.TL.x = 0;
    bounds.TL.y = 0;
    bounds.BR.x = static_cast<float>((frame(10) - frame(6)) * toPoints);
    bounds.BR.y = static_cast<float>((frame(12) - frame(8)) * toPoints);
  }
  unsigned int width = 0, height = 0;
  if (wmf_display_size(gPlayer, &width, &height, kDotsPerInch, kDotsPerInch) != wmf_E_None ||
      !(std::isfinite(bounds.TL.x) && std::isfinite(bounds.TL.y) && std::isfinite(bounds.BR.x) &&
        std::isfinite(bounds.BR.y)) ||
      !(bounds.BR.x > bounds.TL.x) || !(bounds.BR.y > bounds.TL.y)) {
    return Answer(Reply::kNoPictureSize);
  }
  if (width == 0 || height == 0 || std::uint64_t{width} * height > maxPixels) {
    return Answer(Reply::kSize, width, height);
  }

  const rlim_t drawing = limits::CpuSeconds(std::uint64_t{width} * height);
  if (!SetLimit(RLIMIT_CPU, drawing, limits::CpuSeconds(maxPixels) + 1)) {
    return Answer(Reply::kNotStarted);
  }

  auto* device = WMF_GD_GetData(gPlayer);
  device->type = wmf_gd_image;
  device->bbox = bounds;
  device->width = width;
  device->height = height;
  if (wmf_play(gPlayer, 0, &bounds) != wmf_E_None || device->gd_image == nullptr) {
    return Answer(Reply::kNotDrawn);
  }
  const int* pixels = wmf_gd_image_pixels(device->gd_image);
  if (pixels == nullptr) return Answer(Reply::kNotDrawn);
  return SendPicture(pixels, width, height) ? 0 : 1;
}
