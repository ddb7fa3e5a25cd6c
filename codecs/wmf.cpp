// Windows metafiles through libwmf, played by its gd device in quillane-wmf-render, a process of
// its own: a hostile file can keep libwmf drawing for minutes inside a single record, or have it
// allocate without bound, and only a child process can be limited and killed. The header and the
// record sizes are checked here first so that only plausible files are handed over.
#include <algorithm>
#include <array>
#include <cmath>
#include <string>

#include "codecs/codec_internal.h"
#include "codecs/metafile_render.h"
#include "codecs/render_client.h"

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

// A metafile that only places one bitmap (what an editor writes for a photo) is drawn here,
// not by libwmf, whose gd device scales such a bitmap by the wrong factor or draws it as
// streaks. Records that only set state are passed over; anything else, or a bitmap drawn in a
// way this does not follow (part of the bitmap, mirrored, another raster operation), goes to
// libwmf. Returns an empty bitmap then.
class BitmapOnlyMetafile {
 public:
  BitmapOnlyMetafile(Bytes data, std::size_t header) : data_(data), header_(header) {}

  Bitmap32 Draw(std::int64_t maxPixels) {
    if (!Walk()) return {};
    // The DIB: its info header, then the colour table, then the bits.
    const Bytes dib = data_.subspan(dibAt_, dibSize_);
    if (dib.size() < kDibInfoHeaderSize || ReadDword(dib, 0) != kDibInfoHeaderSize) return {};
    const std::uint32_t bitCount = ReadWord(dib, 14), compression = ReadDword(dib, 16);
    std::uint64_t colours = ReadDword(dib, 32);
    if (colours == 0 && bitCount <= 8) colours = std::uint64_t{1} << bitCount;
    if (bitCount > 8) colours = compression == 3 ? 3 : 0;  // BI_BITFIELDS masks
    const std::uint64_t bitsAt = kDibInfoHeaderSize + colours * 4;
    if (bitsAt > dib.size()) return {};
    std::vector<std::uint8_t> file = {'B', 'M'};
    file.resize(14);
    std::uint8_t* at = file.data() + 2;
    Put32(at, static_cast<std::uint32_t>(14 + dib.size()));
    Put32(at, 0);
    Put32(at, static_cast<std::uint32_t>(14 + bitsAt));
    file.insert(file.end(), dib.begin(), dib.end());
    const Bitmap32 bitmap = DecodeWithQt(file, QtFormat::kBitmap, maxPixels);
    if (src_[0] != 0 || src_[1] != 0 || src_[2] != bitmap.Width() || src_[3] != bitmap.Height() ||
        dest_[2] <= 0 || dest_[3] <= 0)
      return {};

    // The picture's size: a placeable file's frame at 96 dots per inch; otherwise the size at
    // which the bitmap is drawn pixel for pixel.
    double width, height;
    if (placeable_) {
      const double inch = ReadWord(data_, 14);
      if (inch == 0) return {};
      width = std::round((ReadShort(data_, 10) - ReadShort(data_, 6)) * 96.0 / inch);
      height = std::round((ReadShort(data_, 12) - ReadShort(data_, 8)) * 96.0 / inch);
    } else {
      width = std::round(std::abs(window_[2]) * static_cast<double>(src_[2]) / dest_[2]);
      height = std::round(std::abs(window_[3]) * static_cast<double>(src_[3]) / dest_[3]);
    }
    CheckPictureSize(static_cast<std::int64_t>(width), static_cast<std::int64_t>(height), maxPixels,
                     "metafile");
    // Logical units to pixels through the window; the bitmap is stretched by nearest pixel.
    const double sx = width / window_[2], sy = height / window_[3];
    const auto toX = [&](double x) {
      return static_cast<std::int64_t>(std::lround((x - window_[0]) * sx));
    };
    const auto toY = [&](double y) {
      return static_cast<std::int64_t>(std::lround((y - window_[1]) * sy));
    };
    const std::int64_t left = toX(dest_[0]), top = toY(dest_[1]);
    const std::int64_t right = toX(dest_[0] + dest_[2]), bottom = toY(dest_[1] + dest_[3]);
    if (right <= left || bottom <= top) return {};
    Bitmap32 picture(static_cast<int>(width), static_cast<int>(height), Pixel{255, 255, 255, 255});
    for (std::int64_t y = std::max<std::int64_t>(top, 0);
         y < std::min<std::int64_t>(bottom, picture.Height()); ++y) {
      const Pixel* from =
          bitmap.ScanLine(static_cast<int>((y - top) * bitmap.Height() / (bottom - top)));
      Pixel* to = picture.ScanLine(static_cast<int>(y));
      for (std::int64_t x = std::max<std::int64_t>(left, 0);
           x < std::min<std::int64_t>(right, picture.Width()); ++x) {
        const Pixel p = from[(x - left) * bitmap.Width() / (right - left)];
        to[x] = Pixel{p.b, p.g, p.r, 255};
      }
    }
    return picture;
  }

 private:
  static std::int16_t ReadShort(Bytes d, std::size_t at) {
    return static_cast<std::int16_t>(ReadWord(d, at));
  }

  // Reads the records; true when they place exactly one bitmap and only set state otherwise.
  bool Walk() {
    placeable_ = header_ != 0;
    if (placeable_) {
      window_ = {ReadShort(data_, 6), ReadShort(data_, 8),
                 ReadShort(data_, 10) - ReadShort(data_, 6),
                 ReadShort(data_, 12) - ReadShort(data_, 8)};
    }
    bool windowSet = placeable_;
    int bitmaps = 0;
    for (std::size_t at = header_ + kStandardHeaderSize;;) {
      const std::size_t size = std::size_t{ReadDword(data_, at)} * 2;  // checked by CheckRecords
      const std::uint16_t function = ReadWord(data_, at + 4);
      const Bytes r = data_.subspan(at + 6, size - 6);
      const auto param = [&r](std::size_t i) {
        return r.size() >= 2 * i + 2 ? ReadShort(r, 2 * i) : 0;
      };
      switch (function) {
        case 0x0000:  // EOF
          return bitmaps == 1 && windowSet && window_[2] != 0 && window_[3] != 0;
        case 0x020B:  // SetWindowOrg (y, x)
          window_[0] = param(1);
          window_[1] = param(0);
          break;
        case 0x020C:  // SetWindowExt (y, x)
          window_[2] = param(1);
          window_[3] = param(0);
          windowSet = true;
          break;
        case 0x0F43:  // StretchDIB: rop, usage, source h, w, y, x, destination h, w, y, x, DIB
          if (r.size() < 22 || ReadDword(r, 0) != kSourceCopy || ReadWord(r, 4) != 0) return false;
          src_ = {param(6), param(5), param(4), param(3)};
          dest_ = {param(10), param(9), param(8), param(7)};
          dibAt_ = at + 6 + 22;
          dibSize_ = r.size() - 22;
          ++bitmaps;
          break;
        case 0x0B41:  // DIBStretchBlt: rop, source h, w, y, x, destination h, w, y, x, DIB
          if (r.size() < 20 + kDibInfoHeaderSize || ReadDword(r, 0) != kSourceCopy) return false;
          src_ = {param(5), param(4), param(3), param(2)};
          dest_ = {param(9), param(8), param(7), param(6)};
          dibAt_ = at + 6 + 20;
          dibSize_ = r.size() - 20;
          ++bitmaps;
          break;
        case 0x0940:  // DIBBitBlt: rop, source y, x, height, width, destination y, x, DIB
          if (r.size() < 16 + kDibInfoHeaderSize || ReadDword(r, 0) != kSourceCopy) return false;
          src_ = {param(3), param(2), param(5), param(4)};
          dest_ = {param(7), param(6), param(5), param(4)};
          dibAt_ = at + 6 + 16;
          dibSize_ = r.size() - 16;
          ++bitmaps;
          break;
        case 0x0103:  // SetMapMode
        case 0x0102:  // SetBkMode
        case 0x0201:  // SetBkColor
        case 0x0104:  // SetROP2
        case 0x0106:  // SetPolyFillMode
        case 0x0107:  // SetStretchBltMode
        case 0x0209:  // SetTextColor
        case 0x012E:  // SetTextAlign
        case 0x001E:  // SaveDC
        case 0x0127:  // RestoreDC
        case 0x0626:  // Escape (comments)
          break;
        default:
          return false;
      }
      at += size;
    }
  }

  static constexpr std::uint32_t kSourceCopy = 0x00CC0020;
  Bytes data_;
  std::size_t header_;
  bool placeable_ = false;
  std::array<int, 4> window_{};  // origin x, y and extent x, y in logical units
  std::array<int, 4> src_{};     // x, y, width, height in the bitmap's pixels
  std::array<int, 4> dest_{};    // x, y, width, height in logical units
  std::size_t dibAt_ = 0, dibSize_ = 0;
};

}  // namespace

Bitmap32 DecodeWindowsMetafile(Bytes data, std::int64_t maxPixels) {
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
  if (Bitmap32 picture = BitmapOnlyMetafile(data, header).Draw(maxPixels); !picture.Empty()) {
    return picture;
  }
  std::vector<std::uint8_t> file(data.begin(), data.end());
  const std::size_t largestField = header + 12;
  for (int i = 0; i < 4; ++i) {
    file[largestField + static_cast<std::size_t>(i)] =
        static_cast<std::uint8_t>(largest >> (8 * i));
  }

  const std::string renderer = FindRenderer("QUILLANE_WMF_RENDER", metafile_render::kWmfProgramName,
                                            QUILLANE_WMF_RENDER_BUILT);
  if (renderer.empty()) throw PictureFileError("The metafile reader is not installed");
  // The renderer never makes a picture larger than the program could hold.
  const std::int64_t rendererMaxPixels =
      std::clamp<std::int64_t>(maxPixels, 0, Bitmap32::kMaxPixels);
  RendererAnswer answer =
      RunRenderer(renderer, {std::to_string(rendererMaxPixels), std::to_string(file.size())}, file,
                  rendererMaxPixels);
  using metafile_render::Reply;
  switch (answer.reply) {
    case Reply::kPicture:
      return std::move(answer.picture);
    case Reply::kSize:
      CheckPictureSize(answer.width, answer.height, rendererMaxPixels, "metafile");
      break;
    case Reply::kNotStarted:
      throw PictureFileError("The metafile reader could not start");
    case Reply::kNotOpened:
      throw PictureFileError("The metafile cannot be opened");
    case Reply::kDamaged:
      throw PictureFileError("The metafile is damaged");
    case Reply::kNoUnitsPerInch:
      throw PictureFileError("The metafile has no units per inch");
    case Reply::kNoPictureSize:
      throw PictureFileError("The metafile has no picture size");
    case Reply::kNotDrawn:
      break;
  }
  throw PictureFileError("The metafile cannot be drawn");
}

Bitmap32 DecodeMetafile(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The metafile is empty");
  if (LooksLikeEnhancedMetafile(data)) return DecodeEnhancedMetafile(data, maxPixels);
  return DecodeWindowsMetafile(data, maxPixels);
}

}  // namespace quillane::codecs
