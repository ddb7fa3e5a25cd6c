// Windows metafiles through libwmf, played by its gd device. libwmf reads the bytes through its own
// bounds-checked memory stream; the header is checked here first so that only plausible files reach
// it, and a status callback stops playback that runs on without end. Qt first: libwmf's headers
// define short macros that clash with Qt's names.
#include <QImage>
// clang-format off
#include <libwmf/api.h>
#include <libwmf/gd.h>
// clang-format on

#include <algorithm>
#include <chrono>
#include <cmath>

#include "codecs/codec_internal.h"

namespace quillane::codecs {
namespace {

constexpr std::uint32_t kPlaceableKey = 0x9AC6CDD7;
constexpr std::size_t kPlaceableSize = 22;
constexpr std::size_t kStandardHeaderSize = 18;

std::uint16_t ReadWord(Bytes d, std::size_t at) {
  return static_cast<std::uint16_t>(d[at] | d[at + 1] << 8);
}
std::uint32_t ReadDword(Bytes d, std::size_t at) {
  return static_cast<std::uint32_t>(ReadWord(d, at)) |
         static_cast<std::uint32_t>(ReadWord(d, at + 2)) << 16;
}

// The standard header: type 1 (memory) or 2 (disk), a header of 9 words, and a version.
bool StandardHeaderAt(Bytes data, std::size_t at) {
  if (data.size() < at + kStandardHeaderSize) return false;
  const std::uint16_t type = ReadWord(data, at);
  return (type == 1 || type == 2) && ReadWord(data, at + 2) == 9 &&
         (ReadWord(data, at + 4) == 0x0100 || ReadWord(data, at + 4) == 0x0300);
}

// Walks the records so that a file whose record sizes run past its end is refused here
// rather than left to the player. Returns the size of the largest record in words.
std::uint32_t CheckRecords(Bytes data, std::size_t at) {
  at += kStandardHeaderSize;
  std::uint32_t largest = 0;
  while (true) {
    if (data.size() - at < 6) throw PictureFileError("The metafile ends inside a record");
    const std::uint64_t words = ReadDword(data, at);
    const std::uint16_t function = ReadWord(data, at + 4);
    if (words < 3 || words * 2 > data.size() - at) {
      throw PictureFileError("The metafile has a record of a bad size");
    }
    largest = std::max(largest, static_cast<std::uint32_t>(words));
    if (function == 0) return largest;  // META_EOF
    at += static_cast<std::size_t>(words * 2);
  }
}

struct Playback {
  std::chrono::steady_clock::time_point deadline;
  bool timedOut = false;
};

int Status(void* context, float) {
  auto* playback = static_cast<Playback*>(context);
  if (std::chrono::steady_clock::now() > playback->deadline) playback->timedOut = true;
  return playback->timedOut ? 1 : 0;
}

// Collects the PNG the player writes. A C callback: nothing may be thrown out of it.
int CollectPng(void* context, char* buffer, int length) {
  if (length <= 0) return 0;
  try {
    auto* png = static_cast<std::vector<std::uint8_t>*>(context);
    png->insert(png->end(), reinterpret_cast<std::uint8_t*>(buffer),
                reinterpret_cast<std::uint8_t*>(buffer) + length);
    return length;
  } catch (...) {
    return 0;
  }
}

class WmfApi {
 public:
  WmfApi() {
    wmfAPI_Options options{};
    options.function = wmf_gd_function;
    const unsigned long flags =
        WMF_OPT_FUNCTION | WMF_OPT_IGNORE_NONFATAL | WMF_OPT_NO_ERROR | WMF_OPT_NO_DEBUG;
    if (wmf_api_create(&api_, flags, &options) != wmf_E_None) {
      if (api_ != nullptr) wmf_api_destroy(api_);
      api_ = nullptr;
      throw PictureFileError("The metafile reader could not start");
    }
  }
  ~WmfApi() {
    if (opened_) wmf_mem_close(api_);
    wmf_api_destroy(api_);  // frees everything the player allocated, the gd image included
  }
  WmfApi(const WmfApi&) = delete;
  WmfApi& operator=(const WmfApi&) = delete;

  wmfAPI* get() { return api_; }
  void Open(Bytes data) {
    // libwmf only reads through this pointer; its interface lacks the const.
    if (wmf_mem_open(api_, const_cast<unsigned char*>(data.data()),
                     static_cast<long>(data.size())) != wmf_E_None) {
      throw PictureFileError("The metafile cannot be opened");
    }
    opened_ = true;
  }

 private:
  wmfAPI* api_ = nullptr;
  bool opened_ = false;
};

}  // namespace

TBitmap32 DecodeWindowsMetafile(Bytes data, std::int64_t maxPixels) {
  std::size_t header = 0;
  if (data.size() >= 4 && ReadDword(data, 0) == kPlaceableKey) header = kPlaceableSize;
  if (!StandardHeaderAt(data, header)) {
    throw PictureFileError("The file is not a Windows metafile");
  }
  if (data.size() > 0x7FFFFFFF) throw PictureFileError("The metafile is too large");
  // The player sizes its record buffer from the header's largest-record field; a made-up
  // value there would have it allocate gigabytes (or too little). The true value is known
  // from the walk, so the player gets a copy of the file carrying it.
  const std::uint32_t largest = CheckRecords(data, header);
  std::vector<std::uint8_t> file(data.begin(), data.end());
  const std::size_t largestField = header + 12;
  for (int i = 0; i < 4; ++i) {
    file[largestField + static_cast<std::size_t>(i)] =
        static_cast<std::uint8_t>(largest >> (8 * i));
  }

  WmfApi api;
  api.Open(file);
  Playback playback;
  playback.deadline = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  wmf_status_function(api.get(), &playback, Status);

  wmfD_Rect bounds{};
  if (wmf_scan(api.get(), 0, &bounds) != wmf_E_None) {
    throw PictureFileError(playback.timedOut ? "The metafile takes too long to read"
                                             : "The metafile is damaged");
  }
  // The player works in points. A placeable file's frame is its bounding box, with the box's
  // top-left corner as the window origin the file's records set; other files are as large as
  // what they draw.
  if (header == kPlaceableSize) {
    const auto frame = [&data](std::size_t at) {
      return static_cast<std::int16_t>(ReadWord(data, at));
    };
    const int unitsPerInch = ReadWord(data, 14);
    if (unitsPerInch == 0) throw PictureFileError("The metafile has no units per inch");
    const double toPoints = 72.0 / unitsPerInch;
    bounds.TL.x = 0;
    bounds.TL.y = 0;
    bounds.BR.x = static_cast<float>((frame(10) - frame(6)) * toPoints);
    bounds.BR.y = static_cast<float>((frame(12) - frame(8)) * toPoints);
  }
  unsigned int width = 0, height = 0;
  if (wmf_display_size(api.get(), &width, &height, kMetafileDotsPerInch, kMetafileDotsPerInch) !=
      wmf_E_None) {
    throw PictureFileError("The metafile has no picture size");
  }
  if (!(std::isfinite(bounds.TL.x) && std::isfinite(bounds.TL.y) && std::isfinite(bounds.BR.x) &&
        std::isfinite(bounds.BR.y)) ||
      !(bounds.BR.x > bounds.TL.x) || !(bounds.BR.y > bounds.TL.y)) {
    throw PictureFileError("The metafile has no picture size");
  }
  CheckPictureSize(width, height, maxPixels, "metafile");

  // The player hands its picture over as PNG: its in-memory image cannot be freed through
  // this version's interface (it would leak), whereas the PNG path frees everything itself.
  std::vector<std::uint8_t> png;
  auto* device = WMF_GD_GetData(api.get());
  if ((device->flags & WMF_GD_SUPPORTS_PNG) == 0) {
    throw PictureFileError("The metafile reader was built without PNG output");
  }
  device->type = wmf_gd_png;
  device->flags |= WMF_GD_OUTPUT_MEMORY | WMF_GD_OWN_BUFFER;
  device->sink.context = &png;
  device->sink.function = CollectPng;
  device->bbox = bounds;
  device->width = width;
  device->height = height;
  if (wmf_play(api.get(), 0, &bounds) != wmf_E_None || png.empty()) {
    throw PictureFileError(playback.timedOut ? "The metafile takes too long to draw"
                                             : "The metafile cannot be drawn");
  }
  QImage image;
  if (!image.loadFromData(png.data(), static_cast<int>(png.size()), "png") ||
      image.width() != static_cast<int>(width) || image.height() != static_cast<int>(height)) {
    throw PictureFileError("The metafile cannot be drawn");
  }
  image.convertTo(QImage::Format_ARGB32);
  if (image.isNull()) throw PictureFileError("Out of memory");

  // Whatever the player left transparent shows the white background.
  TBitmap32 result(static_cast<int>(width), static_cast<int>(height));
  for (int y = 0; y < result.Height(); ++y) {
    Pixel* row = result.ScanLine(y);
    const auto* source = reinterpret_cast<const Pixel*>(image.constScanLine(y));
    for (int x = 0; x < result.Width(); ++x) {
      const Pixel p = source[x];
      const auto over = [alpha = unsigned{p.a}](unsigned c) {
        return static_cast<std::uint8_t>((c * alpha + 255 * (255 - alpha) + 127) / 255);
      };
      row[x] = Pixel{over(p.b), over(p.g), over(p.r), 255};
    }
  }
  return result;
}

TBitmap32 DecodeMetafile(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The metafile is empty");
  if (LooksLikeEnhancedMetafile(data)) return DecodeEnhancedMetafile(data, maxPixels);
  return DecodeWindowsMetafile(data, maxPixels);
}

}  // namespace quillane::codecs
