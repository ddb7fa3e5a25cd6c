#include "data/startup_picture.h"

#include <gtest/gtest.h>

#include <set>
#include <stdexcept>
#include <vector>

#include "tests/codecs/test_support.h"

namespace quillane {
namespace {

TEST(StartupPicture, IsAnOpaqueDetailedPictureOfTheFixedSize) {
  const Bitmap32 picture = StartupPicture();
  ASSERT_EQ(picture.Width(), 521);
  ASSERT_EQ(picture.Height(), 346);
  std::set<std::uint32_t> colours;
  long darkToLight = 0;
  for (int y = 0; y < picture.Height(); ++y) {
    const Pixel* row = picture.ScanLine(y);
    for (int x = 0; x < picture.Width(); ++x) {
      ASSERT_EQ(row[x].a, 255) << x << "," << y;
      colours.insert(ColorRefFromPixel(row[x]));
      if (x > 0 && std::abs(row[x].g - row[x - 1].g) > 40) ++darkToLight;
    }
  }
  // A real scene: many colours, and strong edges for the drawing effects to find.
  EXPECT_GT(colours.size(), 20000u);
  EXPECT_GT(darkToLight, 500);
  // Every call gives the same picture.
  EXPECT_EQ(StartupPicture(), picture);
}

// A small 24-bit BMP whose pixel (x, row in file order) is (B x, G file row, R 200).
std::vector<std::uint8_t> SmallBitmap(int width, int height, bool topDown) {
  const int stride = (width * 3 + 3) & ~3;
  testing::ByteWriter w;
  w.bytes.reserve(static_cast<std::size_t>(54 + stride * height));
  w.U8('B').U8('M').U32(54 + stride * height).U32(0).U32(54);
  w.U32(40).I32(width).I32(topDown ? -height : height).U16(1).U16(24);
  for (int i = 0; i < 6; ++i) w.U32(0);
  for (int row = 0; row < height; ++row) {
    for (int x = 0; x < width; ++x) w.U8(x).U8(row).U8(200);
    for (int pad = width * 3; pad < stride; ++pad) w.U8(0);
  }
  return w.bytes;
}

TEST(DecodeBitmap24, ReadsBottomUpAndTopDownRowsWithPadding) {
  const Bitmap32 bottomUp = DecodeBitmap24(SmallBitmap(3, 2, false));
  ASSERT_EQ(bottomUp.Width(), 3);
  ASSERT_EQ(bottomUp.Height(), 2);
  EXPECT_EQ(bottomUp.At(2, 0), (Pixel{2, 1, 200, 255}));  // the last file row is the top
  EXPECT_EQ(bottomUp.At(1, 1), (Pixel{1, 0, 200, 255}));
  const Bitmap32 topDown = DecodeBitmap24(SmallBitmap(3, 2, true));
  EXPECT_EQ(topDown.At(2, 0), (Pixel{2, 0, 200, 255}));
  EXPECT_EQ(topDown.At(1, 1), (Pixel{1, 1, 200, 255}));
}

TEST(DecodeBitmap24, RefusesDamagedAndForeignFiles) {
  const std::vector<std::uint8_t> good = SmallBitmap(5, 3, false);
  // Cut anywhere: the header, or the last row's last byte.
  for (std::size_t cut : {std::size_t{0}, std::size_t{2}, std::size_t{53}, good.size() - 4})
    EXPECT_THROW(DecodeBitmap24(std::span(good.data(), cut)), std::runtime_error) << cut;
  const auto withField = [&](std::size_t at, std::uint32_t v, int n) {
    std::vector<std::uint8_t> b = good;
    for (int i = 0; i < n; ++i) b[at + i] = static_cast<std::uint8_t>(v >> (8 * i));
    return b;
  };
  // {offset, value, bytes}: not "BM", 32 bits, compressed, width 0, height and width out of
  // range, pixel offset past the end, header size past the end.
  const std::uint32_t fields[][3] = {
      {0, 'X', 1},          {28, 32, 2},          {30, 1, 4},           {18, 0, 4},
      {22, 0x80000000u, 4}, {18, 0x7fffffffu, 4}, {10, 0xfffffff0u, 4}, {14, 0xffffff00u, 4}};
  for (const auto& f : fields)
    EXPECT_THROW(DecodeBitmap24(withField(f[0], f[1], static_cast<int>(f[2]))), std::runtime_error)
        << f[0];
}

}  // namespace
}  // namespace quillane
