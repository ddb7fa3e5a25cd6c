// Enhanced metafiles: a bounds-checked reader that plays the bitmap records, and the writer of
// the single-bitmap metafile that Save produces.
//
// The reader understands the records that place device-independent bitmaps (StretchDIBits,
// BitBlt, StretchBlt, SetDIBitsToDevice) together with the window, viewport and world
// transforms that position them, and plays such files itself. A file with any other drawing
// (lines, shapes, text, fills) goes to quillane-emf-render, a limited process of its own
// (metafile_render.h), once its header and record sizes have been checked here.
#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstring>

#include "codecs/codec_internal.h"
#include "codecs/metafile_render.h"
#include "codecs/render_client.h"

namespace quillane::codecs {
namespace {

enum : std::uint32_t {
  kEmrHeader = 1,
  kEmrEof = 14,
  kEmrSetWindowExtEx = 9,
  kEmrSetWindowOrgEx = 10,
  kEmrSetViewportExtEx = 11,
  kEmrSetViewportOrgEx = 12,
  kEmrSetBrushOrgEx = 13,
  kEmrSetMapperFlags = 16,
  kEmrSetMapMode = 17,
  kEmrSetBkMode = 18,
  kEmrSetPolyFillMode = 19,
  kEmrSetRop2 = 20,
  kEmrSetStretchBltMode = 21,
  kEmrSetTextAlign = 22,
  kEmrSetTextColor = 24,
  kEmrSetBkColor = 25,
  kEmrSaveDc = 33,
  kEmrRestoreDc = 34,
  kEmrSetWorldTransform = 35,
  kEmrModifyWorldTransform = 36,
  kEmrSelectObject = 37,
  kEmrCreatePen = 38,
  kEmrCreateBrushIndirect = 39,
  kEmrDeleteObject = 40,
  kEmrSetMiterLimit = 58,
  kEmrGdiComment = 70,
  kEmrBitBlt = 76,
  kEmrStretchBlt = 77,
  kEmrSetDiBitsToDevice = 80,
  kEmrStretchDiBits = 81,
  kEmrSetIcmMode = 98,
};
constexpr std::uint32_t kEmfSignature = 0x464D4520;  // " EMF"
constexpr std::uint32_t kSrcCopy = 0x00CC0020;
constexpr int kMmText = 1, kMmIsotropic = 7, kMmAnisotropic = 8;
constexpr std::size_t kHeaderSize = 108;
constexpr std::size_t kStretchDiBitsSize = 80;
constexpr std::size_t kEofSize = 20;
constexpr std::size_t kInfoHeaderSize = kDibInfoHeaderSize;

std::uint32_t U32(Bytes d, std::size_t at) {
  return static_cast<std::uint32_t>(d[at]) | static_cast<std::uint32_t>(d[at + 1]) << 8 |
         static_cast<std::uint32_t>(d[at + 2]) << 16 | static_cast<std::uint32_t>(d[at + 3]) << 24;
}
std::int32_t I32(Bytes d, std::size_t at) {
  return static_cast<std::int32_t>(U32(d, at));
}
float F32(Bytes d, std::size_t at) {
  const std::uint32_t bits = U32(d, at);
  float value;
  std::memcpy(&value, &bits, sizeof value);
  return value;
}

// A 2D affine transform x' = m11 x + m21 y + dx, y' = m12 x + m22 y + dy.
struct Transform {
  double m11 = 1, m12 = 0, m21 = 0, m22 = 1, dx = 0, dy = 0;
  Transform Then(const Transform& o) const {
    return Transform{m11 * o.m11 + m12 * o.m21,      m11 * o.m12 + m12 * o.m22,
                     m21 * o.m11 + m22 * o.m21,      m21 * o.m12 + m22 * o.m22,
                     dx * o.m11 + dy * o.m21 + o.dx, dx * o.m12 + dy * o.m22 + o.dy};
  }
  bool Finite() const {
    return std::isfinite(m11) && std::isfinite(m12) && std::isfinite(m21) && std::isfinite(m22) &&
           std::isfinite(dx) && std::isfinite(dy);
  }
};

struct DcState {
  int mapMode = kMmText;
  double windowOrgX = 0, windowOrgY = 0, windowExtX = 1, windowExtY = 1;
  double viewportOrgX = 0, viewportOrgY = 0, viewportExtX = 1, viewportExtY = 1;
  Transform world;

  // Logical coordinates to reference-device pixels.
  Transform LogicalToDevice() const {
    Transform page;
    if ((mapMode == kMmIsotropic || mapMode == kMmAnisotropic) && windowExtX != 0 &&
        windowExtY != 0) {
      page.m11 = viewportExtX / windowExtX;
      page.m22 = viewportExtY / windowExtY;
    }
    page.dx = viewportOrgX - windowOrgX * page.m11;
    page.dy = viewportOrgY - windowOrgY * page.m22;
    return world.Then(page);
  }
};

// The bitmap of a record, decoded through the bitmap reader by putting a file header in
// front of the record's BITMAPINFO and bits.
Bitmap32 DecodeRecordBitmap(Bytes record, std::uint32_t offBmi, std::uint32_t cbBmi,
                            std::uint32_t offBits, std::uint32_t cbBits, std::int64_t maxPixels) {
  const std::uint64_t size = record.size();
  if (cbBmi < 12 || offBmi > size || cbBmi > size - offBmi || offBits > size ||
      cbBits > size - offBits) {
    throw PictureFileError("The metafile holds a bitmap that lies outside its record");
  }
  const std::uint64_t fileSize = 14 + std::uint64_t{cbBmi} + cbBits;
  if (fileSize > 0xFFFFFFFFull) throw PictureFileError("The metafile's bitmap is too large");
  std::vector<std::uint8_t> file;
  file.reserve(static_cast<std::size_t>(fileSize));
  const auto put32 = [&file](std::uint32_t v) {
    for (int i = 0; i < 4; ++i) file.push_back(static_cast<std::uint8_t>(v >> (8 * i)));
  };
  file.push_back('B');
  file.push_back('M');
  put32(static_cast<std::uint32_t>(fileSize));
  put32(0);
  put32(14 + cbBmi);
  file.insert(file.end(), record.begin() + offBmi, record.begin() + offBmi + cbBmi);
  file.insert(file.end(), record.begin() + offBits, record.begin() + offBits + cbBits);
  try {
    return DecodeWithQt(file, QtFormat::kBitmap, maxPixels);
  } catch (const PictureFileError& error) {
    throw PictureFileError(std::string("The metafile holds a bad bitmap: ") + error.what());
  }
}

class Player {
 public:
  Player(Bytes data, std::int64_t maxPixels) : data_(data), maxPixels_(maxPixels) { ReadHeader(); }

  // Whether the file draws anything besides bitmaps: it then goes to the renderer. The walk
  // refuses records of a bad size as playing would.
  bool HasVectorDrawing() const {
    bool vector = false;
    for (std::size_t at = headerSize_; at < data_.size();) {
      if (data_.size() - at < 8) throw PictureFileError("The metafile ends inside a record");
      const std::uint32_t type = U32(data_, at);
      const std::uint32_t size = U32(data_, at + 4);
      if (size < 8 || size > data_.size() - at) {
        throw PictureFileError("The metafile has a record of a bad size");
      }
      if (type == kEmrEof) break;
      vector = vector || !Playable(type, data_.subspan(at, size));
      at += size;
    }
    return vector;
  }

  Bitmap32 Play() {
    canvas_ = Bitmap32(width_, height_, Pixel{255, 255, 255, 255});
    std::size_t at = headerSize_;
    while (at < data_.size()) {
      if (data_.size() - at < 8) throw PictureFileError("The metafile ends inside a record");
      const std::uint32_t type = U32(data_, at);
      const std::uint32_t size = U32(data_, at + 4);
      if (size < 8 || size > data_.size() - at) {
        throw PictureFileError("The metafile has a record of a bad size");
      }
      if (type == kEmrEof) return std::move(canvas_);
      PlayRecord(type, data_.subspan(at, size));
      at += size;
    }
    // Writers that stop without the closing record still leave a usable picture.
    return std::move(canvas_);
  }

  Bitmap32 Render() const;

 private:
  // The records played here, and those that only set state the bitmaps do not depend on.
  // A bitmap record without a bitmap is a brush fill, which is not played here.
  static bool Playable(std::uint32_t type, Bytes r) {
    switch (type) {
      case kEmrSetWindowExtEx:
      case kEmrSetWindowOrgEx:
      case kEmrSetViewportExtEx:
      case kEmrSetViewportOrgEx:
      case kEmrSetBrushOrgEx:
      case kEmrSetMapperFlags:
      case kEmrSetMapMode:
      case kEmrSetBkMode:
      case kEmrSetPolyFillMode:
      case kEmrSetRop2:
      case kEmrSetStretchBltMode:
      case kEmrSetTextAlign:
      case kEmrSetTextColor:
      case kEmrSetBkColor:
      case kEmrSaveDc:
      case kEmrRestoreDc:
      case kEmrSetWorldTransform:
      case kEmrModifyWorldTransform:
      case kEmrSelectObject:
      case kEmrCreatePen:
      case kEmrCreateBrushIndirect:
      case kEmrDeleteObject:
      case kEmrSetMiterLimit:
      case kEmrGdiComment:
      case kEmrSetIcmMode:
        return true;
      // Too short to hold the bitmap fields: refused when played.
      case kEmrStretchDiBits:
      case kEmrSetDiBitsToDevice:
        return r.size() < 56 || U32(r, 52) != 0;
      case kEmrBitBlt:
      case kEmrStretchBlt:
        return r.size() < 92 || U32(r, 88) != 0;
      default:
        return false;
    }
  }

  void ReadHeader() {
    if (!LooksLikeEnhancedMetafile(data_)) {
      throw PictureFileError("The file is not an enhanced metafile");
    }
    const std::uint32_t size = U32(data_, 4);
    if (size < 88 || size > data_.size()) {
      throw PictureFileError("The metafile header has a bad size");
    }
    headerSize_ = size;
    const std::int32_t boundsLeft = I32(data_, 8), boundsTop = I32(data_, 12);
    const std::int32_t boundsRight = I32(data_, 16), boundsBottom = I32(data_, 20);
    const std::int32_t frameLeft = I32(data_, 24), frameTop = I32(data_, 28);
    const std::int32_t frameRight = I32(data_, 32), frameBottom = I32(data_, 36);
    const std::int32_t deviceX = I32(data_, 72), deviceY = I32(data_, 76);
    const std::int32_t millimetresX = I32(data_, 80), millimetresY = I32(data_, 84);

    // The picture's size is its frame (in hundredths of a millimetre) as a 96 dpi device
    // shows it; the frame is mapped onto the reference device the metafile was made for.
    double width = 0, height = 0;
    double deviceLeft = 0, deviceTop = 0, deviceWidth = 0, deviceHeight = 0;
    const double frameWidth = static_cast<double>(frameRight) - frameLeft;
    const double frameHeight = static_cast<double>(frameBottom) - frameTop;
    if (frameWidth > 0 && frameHeight > 0 && deviceX > 0 && deviceY > 0 && millimetresX > 0 &&
        millimetresY > 0) {
      width = std::nearbyint(frameWidth * kMetafileDotsPerInch / 2540.0);
      height = std::nearbyint(frameHeight * kMetafileDotsPerInch / 2540.0);
      const double unitsX = static_cast<double>(deviceX) / (millimetresX * 100.0);
      const double unitsY = static_cast<double>(deviceY) / (millimetresY * 100.0);
      deviceLeft = frameLeft * unitsX;
      deviceTop = frameTop * unitsY;
      deviceWidth = frameWidth * unitsX;
      deviceHeight = frameHeight * unitsY;
    }
    if (width < 1 || height < 1) {
      // No usable frame: fall back to the bounds, in device pixels, inclusive.
      width = static_cast<double>(boundsRight) - boundsLeft + 1;
      height = static_cast<double>(boundsBottom) - boundsTop + 1;
      deviceLeft = boundsLeft;
      deviceTop = boundsTop;
      deviceWidth = width;
      deviceHeight = height;
    }
    if (!(width >= 1 && height >= 1)) {
      throw PictureFileError("The metafile has no picture size");
    }
    if (width > 1e9 || height > 1e9) width = height = 1e9;  // refused just below
    CheckPictureSize(static_cast<std::int64_t>(width), static_cast<std::int64_t>(height),
                     maxPixels_, "metafile");
    width_ = static_cast<int>(width);
    height_ = static_cast<int>(height);
    deviceToCanvas_.m11 = width / deviceWidth;
    deviceToCanvas_.m22 = height / deviceHeight;
    deviceToCanvas_.dx = -deviceLeft * deviceToCanvas_.m11;
    deviceToCanvas_.dy = -deviceTop * deviceToCanvas_.m22;
    // A playback may paint every canvas pixel a few times over; beyond that it is a file
    // made to keep the reader busy.
    paintBudget_ = static_cast<std::int64_t>(width * height) * 16 + (1 << 20);
  }

  void PlayRecord(std::uint32_t type, Bytes r) {
    const auto need = [&r](std::size_t size) {
      if (r.size() < size) throw PictureFileError("The metafile has a record that is too short");
    };
    switch (type) {
      case kEmrSetMapMode:
        need(12);
        dc_.mapMode = I32(r, 8);
        break;
      case kEmrSetWindowExtEx:
        need(16);
        dc_.windowExtX = I32(r, 8);
        dc_.windowExtY = I32(r, 12);
        break;
      case kEmrSetWindowOrgEx:
        need(16);
        dc_.windowOrgX = I32(r, 8);
        dc_.windowOrgY = I32(r, 12);
        break;
      case kEmrSetViewportExtEx:
        need(16);
        dc_.viewportExtX = I32(r, 8);
        dc_.viewportExtY = I32(r, 12);
        break;
      case kEmrSetViewportOrgEx:
        need(16);
        dc_.viewportOrgX = I32(r, 8);
        dc_.viewportOrgY = I32(r, 12);
        break;
      case kEmrSaveDc:
        if (saved_.size() < 1024) saved_.push_back(dc_);
        break;
      case kEmrRestoreDc: {
        need(12);
        const std::int32_t which = I32(r, 8);
        // Negative: relative to the newest saved state; positive: an absolute level.
        std::int64_t index = which < 0 ? static_cast<std::int64_t>(saved_.size()) + which
                                       : static_cast<std::int64_t>(which) - 1;
        if (index >= 0 && index < static_cast<std::int64_t>(saved_.size())) {
          dc_ = saved_[static_cast<std::size_t>(index)];
          saved_.resize(static_cast<std::size_t>(index));
        }
        break;
      }
      case kEmrSetWorldTransform:
        need(32);
        dc_.world = ReadTransform(r, 8);
        break;
      case kEmrModifyWorldTransform: {
        need(36);
        const Transform t = ReadTransform(r, 8);
        switch (U32(r, 32)) {
          case 1:  // MWT_IDENTITY
            dc_.world = Transform{};
            break;
          case 2:  // MWT_LEFTMULTIPLY
            dc_.world = t.Then(dc_.world);
            break;
          case 3:  // MWT_RIGHTMULTIPLY
            dc_.world = dc_.world.Then(t);
            break;
          case 4:  // MWT_SET
            dc_.world = t;
            break;
          default:
            break;
        }
        break;
      }
      case kEmrStretchDiBits:
        need(80);
        if (U32(r, 52) == 0) break;  // no bitmap: a pattern fill, not played
        DrawBitmap(r, U32(r, 48), U32(r, 52), U32(r, 56), U32(r, 60), I32(r, 24), I32(r, 28),
                   I32(r, 72), I32(r, 76), I32(r, 32), I32(r, 36), I32(r, 40), I32(r, 44), true);
        break;
      case kEmrSetDiBitsToDevice:
        need(76);
        if (U32(r, 52) == 0) break;
        DrawBitmap(r, U32(r, 48), U32(r, 52), U32(r, 56), U32(r, 60), I32(r, 24), I32(r, 28),
                   I32(r, 40), I32(r, 44), I32(r, 32), I32(r, 36), I32(r, 40), I32(r, 44), true);
        break;
      case kEmrBitBlt:
        need(100);
        if (U32(r, 88) == 0) break;
        DrawBitmap(r, U32(r, 84), U32(r, 88), U32(r, 92), U32(r, 96), I32(r, 24), I32(r, 28),
                   I32(r, 32), I32(r, 36), I32(r, 44), I32(r, 48), I32(r, 32), I32(r, 36), false);
        break;
      case kEmrStretchBlt:
        need(108);
        if (U32(r, 88) == 0) break;
        DrawBitmap(r, U32(r, 84), U32(r, 88), U32(r, 92), U32(r, 96), I32(r, 24), I32(r, 28),
                   I32(r, 32), I32(r, 36), I32(r, 44), I32(r, 48), I32(r, 100), I32(r, 104), false);
        break;
      default:
        break;
    }
  }

  static Transform ReadTransform(Bytes r, std::size_t at) {
    return Transform{F32(r, at),      F32(r, at + 4),  F32(r, at + 8),
                     F32(r, at + 12), F32(r, at + 16), F32(r, at + 20)};
  }

  // Source rectangle (sx, sy, sw, sh) in top-down bitmap pixels, destination (dx, dy, dw, dh)
  // in logical units; negative extents mirror. The DIB calls count a bottom-up bitmap's
  // source rows from its bottom edge; the blits see it as a device context, from the top.
  void DrawBitmap(Bytes r, std::uint32_t offBmi, std::uint32_t cbBmi, std::uint32_t offBits,
                  std::uint32_t cbBits, std::int32_t dx, std::int32_t dy, std::int32_t dw,
                  std::int32_t dh, std::int32_t sx, std::int32_t sy, std::int32_t sw,
                  std::int32_t sh, bool rowsFromBottom) {
    if (dw == 0 || dh == 0 || sw == 0 || sh == 0) return;
    const Bitmap32 bitmap = DecodeRecordBitmap(r, offBmi, cbBmi, offBits, cbBits, maxPixels_);
    // Source y counts from the bottom row of a bottom-up bitmap.
    const std::int32_t infoHeight = cbBmi >= 40 ? I32(r, offBmi + 8) : 1;
    std::int64_t srcX = sx, srcY = sy, srcW = sw, srcH = sh;
    if (rowsFromBottom && infoHeight > 0)
      srcY = std::int64_t{bitmap.Height()} - (std::int64_t{sy} + sh);
    if (srcW < 0) {
      srcX += srcW;
      srcW = -srcW;
    }
    if (srcH < 0) {
      srcY += srcH;
      srcH = -srcH;
    }

    const Transform toCanvas = dc_.LogicalToDevice().Then(deviceToCanvas_);
    if (!toCanvas.Finite()) return;
    // Only axis-aligned placement is played; rotated or sheared bitmaps are skipped.
    if (toCanvas.m12 != 0 || toCanvas.m21 != 0) return;
    double x0 = toCanvas.m11 * dx + toCanvas.dx,
           x1 = toCanvas.m11 * (static_cast<double>(dx) + dw) + toCanvas.dx;
    double y0 = toCanvas.m22 * dy + toCanvas.dy,
           y1 = toCanvas.m22 * (static_cast<double>(dy) + dh) + toCanvas.dy;
    const bool mirrorX = x1 < x0, mirrorY = y1 < y0;
    if (mirrorX) std::swap(x0, x1);
    if (mirrorY) std::swap(y0, y1);
    // Far outside any canvas: nothing to paint, and the numbers would not fit an integer.
    constexpr double kFar = 4e9;
    if (!(x0 > -kFar && x1 < kFar && y0 > -kFar && y1 < kFar)) return;
    const auto left = static_cast<std::int64_t>(std::nearbyint(x0));
    const auto top = static_cast<std::int64_t>(std::nearbyint(y0));
    const std::int64_t width = static_cast<std::int64_t>(std::nearbyint(x1)) - left;
    const std::int64_t height = static_cast<std::int64_t>(std::nearbyint(y1)) - top;
    if (width < 1 || height < 1) return;
    const std::int64_t cx0 = std::clamp<std::int64_t>(left, 0, canvas_.Width());
    const std::int64_t cx1 = std::clamp<std::int64_t>(left + width, 0, canvas_.Width());
    const std::int64_t cy0 = std::clamp<std::int64_t>(top, 0, canvas_.Height());
    const std::int64_t cy1 = std::clamp<std::int64_t>(top + height, 0, canvas_.Height());
    if (cx0 >= cx1 || cy0 >= cy1) return;
    paintBudget_ -= (cx1 - cx0) * (cy1 - cy0);
    if (paintBudget_ < 0) throw PictureFileError("The metafile draws far more than its picture");

    for (std::int64_t y = cy0; y < cy1; ++y) {
      std::int64_t row = y - top;
      if (mirrorY) row = height - 1 - row;
      // The source row under the middle of this target row (nearest pixel).
      const auto sourceY = static_cast<std::int64_t>(
          srcY + (static_cast<__int128>(2 * row + 1) * srcH) / (2 * height));
      if (sourceY < 0 || sourceY >= bitmap.Height()) continue;
      const Pixel* source = bitmap.ScanLine(static_cast<int>(sourceY));
      Pixel* target = canvas_.ScanLine(static_cast<int>(y));
      for (std::int64_t x = cx0; x < cx1; ++x) {
        std::int64_t column = x - left;
        if (mirrorX) column = width - 1 - column;
        const auto sourceX = static_cast<std::int64_t>(
            srcX + (static_cast<__int128>(2 * column + 1) * srcW) / (2 * width));
        if (sourceX < 0 || sourceX >= bitmap.Width()) continue;
        target[x] = Pixel{source[sourceX].b, source[sourceX].g, source[sourceX].r, 255};
      }
    }
  }

  Bytes data_;
  std::int64_t maxPixels_;
  std::size_t headerSize_ = 0;
  int width_ = 0, height_ = 0;
  Bitmap32 canvas_;
  Transform deviceToCanvas_;
  DcState dc_;
  std::vector<DcState> saved_;
  std::int64_t paintBudget_ = 0;
};

Bitmap32 Player::Render() const {
  if (data_.size() > 0x7FFFFFFF) throw PictureFileError("The metafile is too large");
  if (!deviceToCanvas_.Finite()) throw PictureFileError("The metafile cannot be drawn");
  const std::string renderer = FindRenderer("QUILLANE_EMF_RENDER", metafile_render::kEmfProgramName,
                                            QUILLANE_EMF_RENDER_BUILT);
  if (renderer.empty()) throw PictureFileError("The metafile reader is not installed");
  // Whatever the program's locale: the renderer reads a decimal point.
  const auto number = [](double value) {
    char text[40];
    const auto end = std::to_chars(text, text + sizeof text, value).ptr;
    return std::string(text, end);
  };
  RendererAnswer answer =
      RunRenderer(renderer,
                  {std::to_string(width_), std::to_string(height_), std::to_string(data_.size()),
                   number(deviceToCanvas_.m11), number(deviceToCanvas_.m22),
                   number(deviceToCanvas_.dx), number(deviceToCanvas_.dy)},
                  data_, std::int64_t{width_} * height_);
  if (answer.reply == metafile_render::Reply::kNotStarted) {
    throw PictureFileError("The metafile reader could not start");
  }
  if (answer.reply != metafile_render::Reply::kPicture || answer.picture.Width() != width_ ||
      answer.picture.Height() != height_) {
    throw PictureFileError("The metafile cannot be drawn");
  }
  return std::move(answer.picture);
}

}  // namespace

bool LooksLikeEnhancedMetafile(Bytes data) {
  return data.size() >= 88 && U32(data, 0) == kEmrHeader && U32(data, 40) == kEmfSignature;
}

Bitmap32 DecodeEnhancedMetafile(Bytes data, std::int64_t maxPixels) {
  Player player(data, maxPixels);
  return player.HasVectorDrawing() ? player.Render() : player.Play();
}

// A header, one StretchDIBits record holding the picture as a bottom-up 24-bit DIB drawn at
// (0, 0) with its own size, and the closing record. The reference device is a 96 dpi screen
// (4800 by 2400 pixels on 1270 by 635 mm), so the frame reads back as the picture's size.
void EncodeEnhancedMetafile(const Bitmap32& picture, ByteSink& sink) {
  if (picture.Empty()) throw PictureFileError("There is no picture to save");
  const std::uint32_t w = static_cast<std::uint32_t>(picture.Width());
  const std::uint32_t h = static_cast<std::uint32_t>(picture.Height());
  const std::uint64_t bitsSize = Dib24BitsSize(picture);
  const std::uint64_t dibRecordSize = kStretchDiBitsSize + kInfoHeaderSize + bitsSize;
  const std::uint64_t total = kHeaderSize + dibRecordSize + kEofSize;
  if (total > 0xFFFFFFFFull) throw PictureFileError("The picture is too large for a metafile");

  std::uint8_t head[kHeaderSize + kStretchDiBitsSize] = {};
  std::uint8_t* at = head;
  const auto frame = [](std::uint32_t pixels) {
    return static_cast<std::uint32_t>(std::nearbyint(pixels * 2540.0 / kMetafileDotsPerInch));
  };
  // EMR_HEADER
  Put32(at, kEmrHeader);
  Put32(at, kHeaderSize);
  Put32(at, 0);  // rclBounds, inclusive device pixels
  Put32(at, 0);
  Put32(at, w - 1);
  Put32(at, h - 1);
  Put32(at, 0);  // rclFrame, hundredths of a millimetre
  Put32(at, 0);
  Put32(at, frame(w));
  Put32(at, frame(h));
  Put32(at, kEmfSignature);
  Put32(at, 0x10000);  // version
  Put32(at, static_cast<std::uint32_t>(total));
  Put32(at, 3);  // records
  Put16(at, 1);  // handles (the reserved one)
  Put16(at, 0);
  Put32(at, 0);  // description length and offset
  Put32(at, 0);
  Put32(at, 0);     // palette entries
  Put32(at, 4800);  // reference device, pixels
  Put32(at, 2400);
  Put32(at, 1270);  // and millimetres
  Put32(at, 635);
  Put32(at, 0);  // no pixel format, no OpenGL
  Put32(at, 0);
  Put32(at, 0);
  Put32(at, 1270000);  // micrometres
  Put32(at, 635000);
  // EMR_STRETCHDIBITS
  Put32(at, kEmrStretchDiBits);
  Put32(at, static_cast<std::uint32_t>(dibRecordSize));
  Put32(at, 0);
  Put32(at, 0);
  Put32(at, w - 1);
  Put32(at, h - 1);
  Put32(at, 0);  // xDest, yDest
  Put32(at, 0);
  Put32(at, 0);  // xSrc, ySrc
  Put32(at, 0);
  Put32(at, w);  // cxSrc, cySrc
  Put32(at, h);
  Put32(at, kStretchDiBitsSize);  // offBmiSrc, cbBmiSrc
  Put32(at, kInfoHeaderSize);
  Put32(at, kStretchDiBitsSize + kInfoHeaderSize);  // offBitsSrc, cbBitsSrc
  Put32(at, static_cast<std::uint32_t>(bitsSize));
  Put32(at, 0);  // DIB_RGB_COLORS
  Put32(at, kSrcCopy);
  Put32(at, w);  // cxDest, cyDest
  Put32(at, h);
  sink.Write(head, sizeof head);
  WriteDib24(picture, sink);

  std::uint8_t eof[kEofSize];
  at = eof;
  Put32(at, kEmrEof);
  Put32(at, kEofSize);
  Put32(at, 0);   // palette entries
  Put32(at, 16);  // their offset
  Put32(at, kEofSize);
  sink.Write(eof, sizeof eof);
}

}  // namespace quillane::codecs
