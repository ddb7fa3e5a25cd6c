// The working bitmap: every picture the program holds or computes is 32 bits per pixel, so
// every routine can walk its rows as arrays of four-byte pixels.
#pragma once

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <vector>

namespace quillane {

// One pixel in memory order blue, green, red, alpha. Read as a little-endian 32-bit word it is
// 0xAARRGGBB.
struct Pixel {
  std::uint8_t b = 0;
  std::uint8_t g = 0;
  std::uint8_t r = 0;
  std::uint8_t a = 0;

  friend bool operator==(const Pixel&, const Pixel&) = default;
};
static_assert(sizeof(Pixel) == 4, "pixels are packed four-byte B, G, R, A");

// Colours exchanged with controls and dialogs are 0x00BBGGRR: red in the lowest byte.
constexpr Pixel PixelFromColorRef(std::uint32_t color, std::uint8_t alpha = 255) {
  return Pixel{static_cast<std::uint8_t>(color >> 16), static_cast<std::uint8_t>(color >> 8),
               static_cast<std::uint8_t>(color), alpha};
}
constexpr std::uint32_t ColorRefFromPixel(Pixel p) {
  return static_cast<std::uint32_t>(p.r) | (static_cast<std::uint32_t>(p.g) << 8) |
         (static_cast<std::uint32_t>(p.b) << 16);
}

// Thrown by row access outside the bitmap. No routine is meant to reach it; it guards against
// a fault turning into an out-of-bounds access.
class ScanLineError : public std::out_of_range {
 public:
  ScanLineError() : std::out_of_range("Scan line index out of range") {}
};

class TBitmap32 {
 public:
  // The largest picture the program accepts, in pixels (about 268 megapixels, 1 GiB of pixel
  // data). Decoders refuse larger pictures before allocating anything.
  static constexpr std::int64_t kMaxPixels = std::int64_t{1} << 28;

  TBitmap32() = default;
  // A bitmap of the given size with every byte 0 (alpha 0, as a converted picture has).
  // A width or height of 0 or below gives the empty 0 by 0 bitmap.
  TBitmap32(int width, int height) { SetSize(width, height); }
  // A bitmap of the given size filled with one pixel.
  TBitmap32(int width, int height, Pixel fill);

  int Width() const { return width_; }
  int Height() const { return height_; }
  bool Empty() const { return width_ == 0; }
  std::size_t PixelCount() const { return pixels_.size(); }

  // Resizes to width by height with every byte 0; the former content is discarded. A width or
  // height of 0 or below gives 0 by 0. Throws std::length_error beyond kMaxPixels.
  void SetSize(int width, int height);

  // The row pointer of row y (0 is the top row). Throws ScanLineError outside 0..Height-1.
  Pixel* ScanLine(int y) {
    CheckRow(y);
    return pixels_.data() + static_cast<std::size_t>(y) * static_cast<std::size_t>(width_);
  }
  const Pixel* ScanLine(int y) const {
    CheckRow(y);
    return pixels_.data() + static_cast<std::size_t>(y) * static_cast<std::size_t>(width_);
  }

  // All pixels, row after row with no padding.
  Pixel* Data() { return pixels_.data(); }
  const Pixel* Data() const { return pixels_.data(); }

  Pixel& At(int x, int y) { return ScanLine(y)[CheckedColumn(x)]; }
  const Pixel& At(int x, int y) const { return ScanLine(y)[CheckedColumn(x)]; }

  friend bool operator==(const TBitmap32&, const TBitmap32&) = default;

  // Composites this bitmap (the overlay), its top-left pixel placed at (x, y) of target, over
  // target, in place. Per pixel with target alpha at and overlay alpha ao:
  //   at = 0 and ao = 0      -> (255, 255, 255, 0)
  //   ao = 0                 -> target unchanged
  //   at = 0 or ao = 255     -> the overlay pixel
  //   otherwise, d = 255 (ao + at) - ao at:
  //     channel = (at (255 - ao) t + 255 ao o) div d, alpha = d div 255 (truncating).
  // Only the intersection of both rectangles is touched.
  void DrawOver(int x, int y, TBitmap32& target) const;

 private:
  void CheckRow(int y) const {
    if (y < 0 || y >= height_) throw ScanLineError();
  }
  int CheckedColumn(int x) const {
    if (x < 0 || x >= width_) throw std::out_of_range("Pixel index out of range");
    return x;
  }

  int width_ = 0;
  int height_ = 0;
  std::vector<Pixel> pixels_;
};

// Sets the alpha byte of every pixel to value; colour bytes are untouched.
void SetAlphaChannel(TBitmap32& bitmap, std::uint8_t value);

// Resamples bitmap in place to Trunc(W * widthFactor) by Trunc(H * heightFactor), both
// computed in extended precision, by nearest pixel: target pixel (x, y) copies source pixel
// (x * W / W', y * H / H') in integer arithmetic, so every target pixel is one source pixel and
// the whole source rectangle is covered. A new size of 0 or below (or a factor that is not a
// finite number) gives the empty bitmap.
void ZoomInandOut(TBitmap32& bitmap, long double heightFactor, long double widthFactor);

}  // namespace quillane
