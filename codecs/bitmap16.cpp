// 16-bit bitmaps: Qt's reader widens each field by multiplying with 256 / 2^bits, so the 5-bit
// white 31 becomes 248 and a field wider than 8 bits becomes 0. Qt still checks the file and
// settles its size; the pixels are then taken again from the file's own words, each field
// widened to the full range.
//
// A field of maximum m (31 for 5 bits, 63 for 6) becomes round(v * 255 / m), the nearest 8-bit
// level: white is 255 and every level is as close to the stored intensity as 8 bits allow.
// Bit replication ((v << 3) | (v >> 2) for 5 bits) also reaches 0 and 255 but lands one level
// lower for 3, 7, 24 and 28 of the 5-bit values (24 for 3 where the intensity is 24.7, 57 for
// 7 where it is 57.6), and it has no natural form for fields wider than 8 bits. m is odd, so
// the rounding never meets a tie.
#include <algorithm>
#include <bit>
#include <cstdint>
#include <vector>

#include "codecs/codec_internal.h"

namespace quillane::codecs {
namespace {

std::uint32_t Le(Bytes d, std::size_t at, int bytes) {
  std::uint32_t v = 0;
  for (int i = bytes - 1; i >= 0; --i) v = v << 8 | d[at + static_cast<std::size_t>(i)];
  return v;
}

// One field of the 16-bit word: its 8-bit value for every word, through a table of the
// field's levels.
class Field {
 public:
  explicit Field(std::uint32_t mask) : mask_(mask & 0xFFFF) {
    if (mask_ == 0) return;
    shift_ = std::countr_zero(mask_);
    const std::uint32_t max = mask_ >> shift_;
    levels_.resize(max + 1);
    for (std::uint32_t v = 0; v <= max; ++v)
      levels_[v] = static_cast<std::uint8_t>((v * 255 + max / 2) / max);
  }
  bool Present() const { return mask_ != 0; }
  std::uint8_t operator()(std::uint32_t word) const {
    return mask_ == 0 ? 0 : levels_[(word & mask_) >> shift_];
  }

 private:
  std::uint32_t mask_;
  int shift_ = 0;
  std::vector<std::uint8_t> levels_;
};

}  // namespace

void WidenSixteenBitBitmap(Bytes data, Bitmap32& picture) {
  constexpr std::uint32_t kRgb = 0, kBitFields = 3, kAlphaBitFields = 6;
  if (data.size() < 54 || picture.Empty()) return;
  const std::uint32_t infoSize = Le(data, 14, 4);
  // The OS/2 core header has no 16-bit form.
  if (infoSize < 40 || Le(data, 28, 2) != 16) return;
  const std::uint32_t compression = Le(data, 30, 4);
  std::uint32_t masks[4] = {0x7C00, 0x03E0, 0x001F, 0};  // BI_RGB: 5-5-5, top bit unused
  std::uint64_t headersEnd = 14 + std::uint64_t{infoSize};
  if (compression == kBitFields || compression == kAlphaBitFields) {
    // After a 40-byte header the masks follow it; later headers hold them at the same place.
    const int count = compression == kAlphaBitFields || infoSize >= 56 ? 4 : 3;
    if (infoSize == 40) headersEnd += 4 * static_cast<std::uint64_t>(count);
    if (data.size() < 54 + 4 * static_cast<std::size_t>(count)) return;
    for (int i = 0; i < 4; ++i)
      masks[i] = i < count ? Le(data, 54 + 4 * static_cast<std::size_t>(i), 4) : 0;
  } else if (compression != kRgb) {
    return;
  }
  const std::int64_t width = static_cast<std::int32_t>(Le(data, 18, 4));
  const std::int64_t storedHeight = static_cast<std::int32_t>(Le(data, 22, 4));
  const std::int64_t height = storedHeight < 0 ? -storedHeight : storedHeight;
  if (width != picture.Width() || height != picture.Height()) return;
  const std::uint64_t start = std::max<std::uint64_t>(Le(data, 10, 4), headersEnd);
  const std::uint64_t stride = (static_cast<std::uint64_t>(width) * 2 + 3) / 4 * 4;
  if (start + stride * static_cast<std::uint64_t>(height - 1) +
          2 * static_cast<std::uint64_t>(width) >
      data.size())
    return;

  const Field red(masks[0]), green(masks[1]), blue(masks[2]), alpha(masks[3]);
  for (int y = 0; y < picture.Height(); ++y) {
    const std::int64_t fileRow = storedHeight < 0 ? y : height - 1 - y;
    const std::uint8_t* words = data.data() + start + stride * static_cast<std::uint64_t>(fileRow);
    Pixel* row = picture.ScanLine(y);
    for (int x = 0; x < picture.Width(); ++x, words += 2) {
      const std::uint32_t word = words[0] | std::uint32_t{words[1]} << 8;
      row[x] = Pixel{blue(word), green(word), red(word), alpha.Present() ? alpha(word) : row[x].a};
    }
  }
}

}  // namespace quillane::codecs
