#include "document/packed_picture.h"

#include <zstd.h>

#include <algorithm>
#include <stdexcept>

#include "imaging/parallel.h"

namespace quillane {

namespace {

// About a megabyte of pixels per band: enough for the compressor to find its patterns, small
// enough that the bands spread over the threads.
constexpr std::size_t kBandBytes = std::size_t{1} << 20;
// The fastest level: packing runs behind every history step.
constexpr int kLevel = 1;

// A band is stored as four planes (green, blue - green, red - green, alpha), each byte the
// difference from the pixel above it (from its left neighbour in the band's first row).
// Neighbouring pixels of a photo differ little and its channels move together, so the planes
// are mostly small numbers the compressor codes in a few bits; a flat alpha plane costs next to
// nothing. Predicting from above keeps every pixel of a row independent of the others, so
// unpacking runs at memory speed.
struct Planes {
  Planes(std::uint8_t* data, std::size_t planeSize)
      : g(data), b(data + planeSize), r(data + 2 * planeSize), a(data + 3 * planeSize) {}
  std::uint8_t *g, *b, *r, *a;
};

inline std::uint8_t Byte(int v) {
  return static_cast<std::uint8_t>(v);
}

void SplitRows(const Bitmap32& picture, int y0, int y1, std::uint8_t* data) {
  const int width = picture.Width();
  Planes planes(data, static_cast<std::size_t>(width) * static_cast<std::size_t>(y1 - y0));
  for (int y = y0; y < y1; ++y) {
    const Pixel* row = picture.ScanLine(y);
    if (y == y0) {
      Pixel left{};
      for (int x = 0; x < width; ++x) {
        const Pixel p = row[x];
        planes.g[x] = Byte(p.g - left.g);
        planes.b[x] = Byte(Byte(p.b - p.g) - Byte(left.b - left.g));
        planes.r[x] = Byte(Byte(p.r - p.g) - Byte(left.r - left.g));
        planes.a[x] = Byte(p.a - left.a);
        left = p;
      }
    } else {
      const Pixel* above = picture.ScanLine(y - 1);
      for (int x = 0; x < width; ++x) {
        const Pixel p = row[x], u = above[x];
        planes.g[x] = Byte(p.g - u.g);
        planes.b[x] = Byte(Byte(p.b - p.g) - Byte(u.b - u.g));
        planes.r[x] = Byte(Byte(p.r - p.g) - Byte(u.r - u.g));
        planes.a[x] = Byte(p.a - u.a);
      }
    }
    planes.g += width;
    planes.b += width;
    planes.r += width;
    planes.a += width;
  }
}

void JoinRows(std::uint8_t* data, int y0, int y1, Bitmap32& picture) {
  const int width = picture.Width();
  Planes planes(data, static_cast<std::size_t>(width) * static_cast<std::size_t>(y1 - y0));
  for (int y = y0; y < y1; ++y) {
    Pixel* row = picture.ScanLine(y);
    if (y == y0) {
      Pixel left{};
      for (int x = 0; x < width; ++x) {
        const std::uint8_t g = Byte(left.g + planes.g[x]);
        const std::uint8_t b = Byte(Byte(left.b - left.g) + planes.b[x]);
        const std::uint8_t r = Byte(Byte(left.r - left.g) + planes.r[x]);
        left = Pixel{Byte(b + g), g, Byte(r + g), Byte(left.a + planes.a[x])};
        row[x] = left;
      }
    } else {
      const Pixel* above = picture.ScanLine(y - 1);
      for (int x = 0; x < width; ++x) {
        const Pixel u = above[x];
        const std::uint8_t g = Byte(u.g + planes.g[x]);
        const std::uint8_t b = Byte(Byte(u.b - u.g) + planes.b[x]);
        const std::uint8_t r = Byte(Byte(u.r - u.g) + planes.r[x]);
        row[x] = Pixel{Byte(b + g), g, Byte(r + g), Byte(u.a + planes.a[x])};
      }
    }
    planes.g += width;
    planes.b += width;
    planes.r += width;
    planes.a += width;
  }
}

void Check(std::size_t code) {
  if (ZSTD_isError(code)) throw std::runtime_error(ZSTD_getErrorName(code));
}

}  // namespace

PackedPicture PackedPicture::Pack(const Bitmap32& picture) {
  PackedPicture packed;
  packed.width_ = picture.Width();
  packed.height_ = picture.Height();
  if (picture.Empty()) return packed;
  const std::size_t rowBytes = static_cast<std::size_t>(packed.width_) * sizeof(Pixel);
  packed.rowsPerBand_ =
      static_cast<int>(std::clamp<std::size_t>(kBandBytes / rowBytes, 1, packed.height_));
  const int bands = (packed.height_ + packed.rowsPerBand_ - 1) / packed.rowsPerBand_;
  packed.bands_.resize(static_cast<std::size_t>(bands));
  const std::size_t maxBandBytes = rowBytes * static_cast<std::size_t>(packed.rowsPerBand_);
  ParallelRows(0, bands, maxBandBytes, [&](int b0, int b1) {
    std::vector<std::uint8_t> planes(maxBandBytes);
    std::vector<std::uint8_t> out(ZSTD_compressBound(maxBandBytes));
    ZSTD_CCtx* context = ZSTD_createCCtx();
    if (context == nullptr) throw std::bad_alloc();
    try {
      for (int band = b0; band < b1; ++band) {
        const int y0 = band * packed.rowsPerBand_;
        const int y1 = std::min(packed.height_, y0 + packed.rowsPerBand_);
        SplitRows(picture, y0, y1, planes.data());
        const std::size_t size =
            ZSTD_compressCCtx(context, out.data(), out.size(), planes.data(),
                              rowBytes * static_cast<std::size_t>(y1 - y0), kLevel);
        Check(size);
        packed.bands_[static_cast<std::size_t>(band)].assign(
            out.begin(), out.begin() + static_cast<std::ptrdiff_t>(size));
      }
    } catch (...) {
      ZSTD_freeCCtx(context);
      throw;
    }
    ZSTD_freeCCtx(context);
  });
  return packed;
}

std::size_t PackedPicture::Bytes() const {
  std::size_t bytes = 0;
  for (const auto& band : bands_) bytes += band.size();
  return bytes;
}

void PackedPicture::UnpackInto(Bitmap32& target) const {
  if (target.Width() != width_ || target.Height() != height_) target.SetSize(width_, height_);
  if (target.Empty()) return;
  const std::size_t rowBytes = static_cast<std::size_t>(width_) * sizeof(Pixel);
  const std::size_t maxBandBytes = rowBytes * static_cast<std::size_t>(rowsPerBand_);
  ParallelRows(0, static_cast<int>(bands_.size()), maxBandBytes, [&](int b0, int b1) {
    std::vector<std::uint8_t> planes(maxBandBytes);
    ZSTD_DCtx* context = ZSTD_createDCtx();
    if (context == nullptr) throw std::bad_alloc();
    try {
      for (int band = b0; band < b1; ++band) {
        const int y0 = band * rowsPerBand_;
        const int y1 = std::min(height_, y0 + rowsPerBand_);
        const std::size_t expected = rowBytes * static_cast<std::size_t>(y1 - y0);
        const auto& in = bands_[static_cast<std::size_t>(band)];
        const std::size_t size =
            ZSTD_decompressDCtx(context, planes.data(), expected, in.data(), in.size());
        Check(size);
        if (size != expected) throw std::runtime_error("a packed picture band is incomplete");
        JoinRows(planes.data(), y0, y1, target);
      }
    } catch (...) {
      ZSTD_freeDCtx(context);
      throw;
    }
    ZSTD_freeDCtx(context);
  });
}

Bitmap32 PackedPicture::Unpack() const {
  Bitmap32 picture;
  UnpackInto(picture);
  return picture;
}

}  // namespace quillane
