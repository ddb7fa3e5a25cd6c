#include "data/startup_picture.h"

#include <cstdint>
#include <limits>
#include <stdexcept>
#include <string>

namespace quillane {
namespace embedded {
extern const std::uint8_t startup_bmp[];
extern const std::size_t startup_bmp_size;
}  // namespace embedded

namespace {

std::uint32_t U32(std::span<const std::uint8_t> b, std::size_t at) {
  return static_cast<std::uint32_t>(b[at]) | (static_cast<std::uint32_t>(b[at + 1]) << 8) |
         (static_cast<std::uint32_t>(b[at + 2]) << 16) |
         (static_cast<std::uint32_t>(b[at + 3]) << 24);
}
std::uint16_t U16(std::span<const std::uint8_t> b, std::size_t at) {
  return static_cast<std::uint16_t>(b[at] | (b[at + 1] << 8));
}

[[noreturn]] void Fail(const char* why) {
  throw std::runtime_error(std::string("Bitmap picture: ") + why);
}

}  // namespace

Bitmap32 DecodeBitmap24(std::span<const std::uint8_t> bytes) {
  constexpr std::size_t kFileHeader = 14;
  constexpr std::size_t kInfoHeader = 40;
  if (bytes.size() < kFileHeader + kInfoHeader || bytes[0] != 'B' || bytes[1] != 'M')
    Fail("not a bitmap file");
  const std::uint32_t dataOffset = U32(bytes, 10);
  const std::uint32_t infoSize = U32(bytes, 14);
  const auto width = static_cast<std::int32_t>(U32(bytes, 18));
  const auto rawHeight = static_cast<std::int32_t>(U32(bytes, 22));
  if (infoSize < kInfoHeader || kFileHeader + infoSize > bytes.size()) Fail("bad header");
  if (U16(bytes, 26) != 1 || U16(bytes, 28) != 24 || U32(bytes, 30) != 0)
    Fail("only uncompressed 24-bit pictures are read");
  if (width <= 0 || rawHeight == 0 || rawHeight == std::numeric_limits<std::int32_t>::min())
    Fail("bad size");
  const bool topDown = rawHeight < 0;
  const std::int32_t height = topDown ? -rawHeight : rawHeight;
  if (static_cast<std::int64_t>(width) * height > Bitmap32::kMaxPixels) Fail("too large");

  const std::uint64_t stride = (static_cast<std::uint64_t>(width) * 3 + 3) & ~std::uint64_t{3};
  const std::uint64_t needed = static_cast<std::uint64_t>(dataOffset) +
                               stride * static_cast<std::uint64_t>(height - 1) +
                               static_cast<std::uint64_t>(width) * 3;
  if (dataOffset < kFileHeader + infoSize || needed > bytes.size()) Fail("truncated");

  Bitmap32 picture(width, height);
  for (std::int32_t y = 0; y < height; ++y) {
    const std::int32_t fileRow = topDown ? y : height - 1 - y;
    const std::uint8_t* src =
        bytes.data() + dataOffset + stride * static_cast<std::uint64_t>(fileRow);
    Pixel* dst = picture.ScanLine(y);
    for (std::int32_t x = 0; x < width; ++x, src += 3) dst[x] = Pixel{src[0], src[1], src[2], 255};
  }
  return picture;
}

Bitmap32 StartupPicture() {
  return DecodeBitmap24(
      std::span<const std::uint8_t>(embedded::startup_bmp, embedded::startup_bmp_size));
}

}  // namespace quillane
