#include "data/texture_tiles.h"

#include <array>
#include <cstddef>
#include <stdexcept>
#include <string>

#include "data/startup_picture.h"

namespace quillane {
namespace embedded {
#define QUILLANE_TILE(n)                         \
  extern const std::uint8_t texture_##n##_bmp[]; \
  extern const std::size_t texture_##n##_bmp_size;
QUILLANE_TILE(1)
QUILLANE_TILE(2)
QUILLANE_TILE(3)
QUILLANE_TILE(4)
QUILLANE_TILE(5)
QUILLANE_TILE(6)
QUILLANE_TILE(7)
QUILLANE_TILE(8)
QUILLANE_TILE(9)
QUILLANE_TILE(10)
QUILLANE_TILE(11)
QUILLANE_TILE(12)
QUILLANE_TILE(13)
QUILLANE_TILE(14)
QUILLANE_TILE(15)
#undef QUILLANE_TILE
}  // namespace embedded

namespace {

std::uint32_t U32(std::span<const std::uint8_t> b, std::size_t at) {
  return static_cast<std::uint32_t>(b[at]) | (static_cast<std::uint32_t>(b[at + 1]) << 8) |
         (static_cast<std::uint32_t>(b[at + 2]) << 16) |
         (static_cast<std::uint32_t>(b[at + 3]) << 24);
}

[[noreturn]] void Fail(const char* why) {
  throw std::runtime_error(std::string("Bitmap picture: ") + why);
}

}  // namespace

Bitmap32 DecodeBitmap(std::span<const std::uint8_t> bytes) {
  constexpr std::size_t kHeaders = 14 + 40;
  if (bytes.size() < kHeaders || bytes[28] != 8 || bytes[29] != 0) return DecodeBitmap24(bytes);
  if (bytes[0] != 'B' || bytes[1] != 'M') Fail("not a bitmap file");
  const std::uint32_t dataOffset = U32(bytes, 10);
  const std::uint32_t infoSize = U32(bytes, 14);
  const auto width = static_cast<std::int32_t>(U32(bytes, 18));
  const auto rawHeight = static_cast<std::int32_t>(U32(bytes, 22));
  const std::uint32_t used = U32(bytes, 46);
  const std::uint32_t colours = used == 0 ? 256 : used;
  if (infoSize < 40 || bytes[26] != 1 || bytes[27] != 0 || U32(bytes, 30) != 0 || colours > 256)
    Fail("only uncompressed 8-bit pictures with a palette are read");
  if (width <= 0 || rawHeight == 0 || rawHeight < -(1 << 20) || rawHeight > (1 << 20) ||
      width > (1 << 20))
    Fail("bad size");
  const std::int32_t height = rawHeight < 0 ? -rawHeight : rawHeight;
  if (static_cast<std::int64_t>(width) * height > Bitmap32::kMaxPixels) Fail("too large");
  const std::uint64_t palette = 14 + static_cast<std::uint64_t>(infoSize);
  const std::uint64_t stride = (static_cast<std::uint64_t>(width) + 3) & ~std::uint64_t{3};
  if (palette + 4 * colours > dataOffset ||
      dataOffset + stride * static_cast<std::uint64_t>(height - 1) + width > bytes.size())
    Fail("truncated");

  Bitmap32 picture(width, height);
  for (std::int32_t y = 0; y < height; ++y) {
    const std::int32_t fileRow = rawHeight < 0 ? y : height - 1 - y;
    const std::uint8_t* src =
        bytes.data() + dataOffset + stride * static_cast<std::uint64_t>(fileRow);
    Pixel* dst = picture.ScanLine(y);
    for (std::int32_t x = 0; x < width; ++x) {
      // An index past the palette's end shows black, as the common viewers do.
      if (src[x] >= colours) {
        dst[x] = Pixel{0, 0, 0, 255};
        continue;
      }
      const std::uint8_t* entry = bytes.data() + palette + 4 * static_cast<std::size_t>(src[x]);
      dst[x] = Pixel{entry[0], entry[1], entry[2], 255};
    }
  }
  return picture;
}

Bitmap32 TextureTile(int n) {
#define QUILLANE_TILE_SPAN(n) \
  std::span<const std::uint8_t>(embedded::texture_##n##_bmp, embedded::texture_##n##_bmp_size)
  static const std::array<std::span<const std::uint8_t>, kTextureTiles> kFiles{
      QUILLANE_TILE_SPAN(1),  QUILLANE_TILE_SPAN(2),  QUILLANE_TILE_SPAN(3),
      QUILLANE_TILE_SPAN(4),  QUILLANE_TILE_SPAN(5),  QUILLANE_TILE_SPAN(6),
      QUILLANE_TILE_SPAN(7),  QUILLANE_TILE_SPAN(8),  QUILLANE_TILE_SPAN(9),
      QUILLANE_TILE_SPAN(10), QUILLANE_TILE_SPAN(11), QUILLANE_TILE_SPAN(12),
      QUILLANE_TILE_SPAN(13), QUILLANE_TILE_SPAN(14), QUILLANE_TILE_SPAN(15)};
#undef QUILLANE_TILE_SPAN
  if (n < 1 || n > kTextureTiles) throw std::out_of_range("no texture tile " + std::to_string(n));
  return DecodeBitmap(kFiles[static_cast<std::size_t>(n - 1)]);
}

}  // namespace quillane
