// 16-bit bitmaps reach the full range: 5-bit white is 255, not 248.
#include <bit>
#include <cmath>

#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::DecodeWithQt;
using codecs::QtFormat;

struct Layout {
  const char* name;
  int headerSize;
  std::uint32_t compression;
  std::uint32_t masks[4];  // red, green, blue, alpha
  bool topDown;
};

int Bits(std::uint32_t mask) {
  return std::popcount(mask);
}

// The nearest 8-bit level to field value v of a field of the mask's width.
std::uint8_t Full(std::uint32_t mask, std::uint32_t word) {
  if (mask == 0) return 0;
  const double max = (1u << Bits(mask)) - 1;
  const double v = (word & mask) >> std::countr_zero(mask);
  return static_cast<std::uint8_t>(std::lround(v * 255 / max));
}

TEST(SixteenBitBitmap, FieldsWidenToTheNearestFullRangeLevel) {
  const Layout layouts[] = {
      {"5-5-5 BI_RGB", 40, 0, {0x7C00, 0x03E0, 0x001F, 0}, false},
      {"5-6-5 bit fields after the header, top-down", 40, 3, {0xF800, 0x07E0, 0x001F, 0}, true},
      {"5-5-5 bit fields in a version 5 header", 124, 3, {0x7C00, 0x03E0, 0x001F, 0}, false},
      {"4-4-4-4 with alpha in a version 4 header", 108, 3, {0x0F00, 0x00F0, 0x000F, 0xF000}, true},
  };
  // 65 pixels a row: every 6-bit value and a row padded by two bytes.
  constexpr int w = 65, h = 2;
  for (const Layout& l : layouts) {
    SCOPED_TRACE(l.name);
    std::vector<std::uint16_t> words;  // top row first
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x)
        words.push_back(static_cast<std::uint16_t>(y == 0 ? x * 0x0421 + x : ~(x * 0x0841)));
    ByteWriter bits;
    for (int row = 0; row < h; ++row) {
      const int y = l.topDown ? row : h - 1 - row;
      for (int x = 0; x < w; ++x) bits.U16(words[static_cast<std::size_t>(y * w + x)]);
      bits.U16(0);
    }
    ByteWriter masks;
    if (l.headerSize == 40 && l.compression == 3)
      masks.U32(l.masks[0]).U32(l.masks[1]).U32(l.masks[2]);
    const std::vector<std::uint32_t> inHeader(std::begin(l.masks), std::end(l.masks));
    const Bitmap32 p =
        DecodeWithQt(BmpFile(BmpInfoHeader(l.headerSize, w, l.topDown ? -h : h, 16, l.compression,
                                           static_cast<std::uint32_t>(bits.Size()), 0, inHeader),
                             masks.bytes, bits.bytes),
                     QtFormat::kBitmap);
    ASSERT_EQ(p.Width(), w);
    ASSERT_EQ(p.Height(), h);
    for (int y = 0; y < h; ++y)
      for (int x = 0; x < w; ++x) {
        const std::uint16_t word = words[static_cast<std::size_t>(y * w + x)];
        const Pixel want{Full(l.masks[2], word), Full(l.masks[1], word), Full(l.masks[0], word),
                         l.masks[3] ? Full(l.masks[3], word) : std::uint8_t{255}};
        ASSERT_EQ(p.At(x, y), want) << x << "," << y << " word " << word;
      }
  }
}

// The levels a 5- and a 6-bit field give, where rounding and bit replication part ways (5-bit 3
// is 24.7, replication gives 24) and at both ends.
TEST(SixteenBitBitmap, FiveAndSixBitLevels) {
  const std::uint16_t words[] = {0x0000, 0xFFFF, 3 << 11 | 1 << 5 | 7, 24 << 11 | 32 << 5 | 28};
  ByteWriter bits;
  for (std::uint16_t word : words) bits.U16(word);
  ByteWriter masks;
  masks.U32(0xF800).U32(0x07E0).U32(0x001F);
  const Bitmap32 p = DecodeWithQt(
      BmpFile(BmpInfoHeader(40, 4, 1, 16, 3, 8), masks.bytes, bits.bytes), QtFormat::kBitmap);
  ASSERT_EQ(p.Width(), 4);
  EXPECT_EQ(p.At(0, 0), (Pixel{0, 0, 0, 255}));
  EXPECT_EQ(p.At(1, 0), (Pixel{255, 255, 255, 255}));
  EXPECT_EQ(p.At(2, 0), (Pixel{58, 4, 25, 255}));
  EXPECT_EQ(p.At(3, 0), (Pixel{230, 130, 197, 255}));
}

}  // namespace
}  // namespace quillane::testing
