// The working bitmap: every picture the program holds or computes is 32 bits per pixel, so
// every routine can walk its rows as arrays of four-byte pixels.
#pragma once

#include <cstddef>
#include <cstdint>
#include <stdexcept>
#include <utility>
#include <vector>

#include "imaging/picture_memory.h"

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

class Bitmap32 {
 public:
  // The largest picture the program accepts, in pixels (about 268 megapixels, 1 GiB of pixel
  // data). Decoders refuse larger pictures before allocating anything.
  static constexpr std::int64_t kMaxPixels = std::int64_t{1} << 28;

  Bitmap32() = default;
  // A bitmap of the given size with every byte 0 (alpha 0, as a converted picture has).
  // A width or height of 0 or below gives the empty 0 by 0 bitmap.
  Bitmap32(int width, int height) { SetSize(width, height); }
  // A bitmap of the given size filled with one pixel.
  Bitmap32(int width, int height, Pixel fill);
  // A bitmap of the given size whose bytes are left as the memory holds them, for routines
  // that write every pixel anyway (saving a pass over the whole picture).
  static Bitmap32 ForOverwrite(int width, int height);

  Bitmap32(const Bitmap32&) = default;
  Bitmap32& operator=(const Bitmap32& other) {
    pixels_ = other.pixels_;  // first: if it throws, this bitmap stays as it was
    width_ = other.width_;
    height_ = other.height_;
    return *this;
  }
  Bitmap32(Bitmap32&& other) noexcept
      : width_(std::exchange(other.width_, 0)),
        height_(std::exchange(other.height_, 0)),
        pixels_(std::move(other.pixels_)) {}
  Bitmap32& operator=(Bitmap32&& other) noexcept {
    width_ = std::exchange(other.width_, 0);
    height_ = std::exchange(other.height_, 0);
    pixels_ = std::move(other.pixels_);
    return *this;
  }

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

  friend bool operator==(const Bitmap32& a, const Bitmap32& b);

  // Composites this bitmap (the overlay), its top-left pixel placed at (x, y) of target, over
  // target, in place. Per pixel with target alpha at and overlay alpha ao:
  //   at = 0 and ao = 0      -> (255, 255, 255, 0)
  //   ao = 0                 -> target unchanged
  //   at = 0 or ao = 255     -> the overlay pixel
  //   otherwise, d = 255 (ao + at) - ao at:
  //     channel = (at (255 - ao) t + 255 ao o) div d, alpha = d div 255 (truncating).
  // Only the intersection of both rectangles is touched.
  void DrawOver(int x, int y, Bitmap32& target) const;

 private:
  void CheckRow(int y) const {
    if (y < 0 || y >= height_) throw ScanLineError();
  }
  int CheckedColumn(int x) const {
    if (x < 0 || x >= width_) throw std::out_of_range("Pixel index out of range");
    return x;
  }

  // The pixels, in picture memory. Copies reuse the block when the size is the same.
  class Store {
   public:
    Store() = default;
    explicit Store(std::size_t count)
        : data_(count == 0 ? nullptr
                           : static_cast<Pixel*>(AllocatePictureBytes(count * sizeof(Pixel)))),
          count_(count) {}
    Store(const Store& other);
    Store& operator=(const Store& other);
    Store(Store&& other) noexcept
        : data_(std::exchange(other.data_, nullptr)), count_(std::exchange(other.count_, 0)) {}
    Store& operator=(Store&& other) noexcept {
      std::swap(data_, other.data_);
      std::swap(count_, other.count_);
      return *this;
    }
    ~Store() { FreePictureBytes(data_, count_ * sizeof(Pixel)); }

    Pixel* data() { return data_; }
    const Pixel* data() const { return data_; }
    std::size_t size() const { return count_; }

   private:
    Pixel* data_ = nullptr;
    std::size_t count_ = 0;
  };

  // Sets the size without touching the new pixels.
  void Allocate(int width, int height);

  int width_ = 0;
  int height_ = 0;
  Store pixels_;
};

// Sets the alpha byte of every pixel to value; colour bytes are untouched.
void SetAlphaChannel(Bitmap32& bitmap, std::uint8_t value);

// Resamples bitmap in place to Trunc(W * widthFactor) by Trunc(H * heightFactor), both
// computed in extended precision, by nearest pixel: target pixel (x, y) copies source pixel
// (x * W / W', y * H / H') in integer arithmetic, so every target pixel is one source pixel and
// the whole source rectangle is covered. A new size of 0 or below (or a factor that is not a
// finite number) gives the empty bitmap.
void ResampleNearest(Bitmap32& bitmap, long double heightFactor, long double widthFactor);

}  // namespace quillane
