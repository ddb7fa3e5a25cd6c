// PNG reading through libpng. The file's stored sample values are what the picture gets, as
// with every other format: the gamma, chromaticity, sRGB and ICC profile chunks are left
// unapplied (the simplified reader would convert by them). 16-bit samples are reduced to
// (v * 255 + 32767) / 65535, which is what libpng's png_set_scale_16 gives. libpng's complaints
// become the error message; none goes to the terminal. libpng reports errors by longjmp to the one
// function that owns the reader, and only after that function has returned does anything throw.
#include <png.h>

#include <algorithm>
#include <csetjmp>
#include <cstdio>
#include <cstring>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"

namespace quillane::codecs {
namespace {

std::uint32_t Big32(Bytes data, std::size_t at) {
  return std::uint32_t{data[at]} << 24 | std::uint32_t{data[at + 1]} << 16 |
         std::uint32_t{data[at + 2]} << 8 | data[at + 3];
}

// Deflate gives at most 1032 bytes for one (a run of 258 bytes costs at least two bits), so the
// picture data of a PNG file can only hold rows of up to 1032 times its size. A file whose header
// says 16384 by 16384 with 100 bytes of data was otherwise refused only after a gigabyte had been
// filled. Throws when the IDAT chunks are too short for the rows the header announces (filter
// bytes included; interlacing only adds to them).
void CheckPngDataBacksPicture(Bytes data, std::uint64_t width, std::uint64_t height) {
  constexpr std::uint64_t kDeflateMostPerByte = 1032;
  constexpr std::uint64_t kZlibWrapping = 6;
  std::uint64_t idat = 0;
  unsigned depth = 8, channels = 4;
  for (std::size_t at = 8; at + 8 <= data.size();) {
    const std::uint64_t length = Big32(data, at);
    const bool header = std::equal(data.begin() + at + 4, data.begin() + at + 8, "IHDR");
    if (header && length >= 13 && at + 8 + 13 <= data.size()) {
      depth = data[at + 8 + 8];
      constexpr unsigned kChannels[7] = {1, 0, 3, 1, 2, 0, 4};
      const unsigned type = data[at + 8 + 9];
      channels = type < 7 && kChannels[type] > 0 ? kChannels[type] : 4;
    }
    if (std::equal(data.begin() + at + 4, data.begin() + at + 8, "IDAT")) idat += length;
    at += 12 + length;
  }
  const std::uint64_t rowBytes = (width * depth * channels + 7) / 8 + 1;
  // libpng refuses sides beyond a million pixels, so this cannot overflow.
  const std::uint64_t rows = height * rowBytes;
  if (idat <= kZlibWrapping || (idat - kZlibWrapping) * kDeflateMostPerByte < rows) {
    throw PictureFileError("The PNG file is truncated (" + std::to_string(idat) +
                           " bytes of picture data cannot hold a picture of " +
                           std::to_string(width) + " by " + std::to_string(height) + " pixels)");
  }
}

struct PngSource {
  Bytes data;
  std::size_t at = 0;
  bool headerRead = false;
  char message[160] = "";
};

void ReadFromMemory(png_structp png, png_bytep out, png_size_t size) {
  auto* source = static_cast<PngSource*>(png_get_io_ptr(png));
  if (size > source->data.size() - source->at) png_error(png, "the file ends too early");
  std::memcpy(out, source->data.data() + source->at, size);
  source->at += size;
}

[[noreturn]] void OnError(png_structp png, png_const_charp text) {
  auto* source = static_cast<PngSource*>(png_get_error_ptr(png));
  std::snprintf(source->message, sizeof source->message, "%s", text);
  png_longjmp(png, 1);
}

void OnWarning(png_structp, png_const_charp) {}

struct PngReader {
  png_structp png = nullptr;
  png_infop info = nullptr;
  ~PngReader() {
    if (png != nullptr) png_destroy_read_struct(&png, info != nullptr ? &info : nullptr, nullptr);
  }
};

// Everything libpng touches happens here; returns false with source.message set on failure.
bool RunPngDecoder(PngReader& r, PngSource& source, std::int64_t maxPixels, Bitmap32& result,
                   std::vector<png_bytep>& rows, std::string& sizeProblem) {
  if (setjmp(png_jmpbuf(r.png))) return false;
  png_set_read_fn(r.png, &source, ReadFromMemory);
  png_read_info(r.png, r.info);
  source.headerRead = true;
  const std::int64_t width = png_get_image_width(r.png, r.info);
  const std::int64_t height = png_get_image_height(r.png, r.info);
  try {
    CheckPngDataBacksPicture(source.data, static_cast<std::uint64_t>(width),
                             static_cast<std::uint64_t>(height));
    CheckPictureSize(width, height, maxPixels, "PNG");
  } catch (const PictureFileError& e) {
    sizeProblem = e.what();
    return true;
  }
  // Palette, gray and transparency colour become B, G, R, A bytes, with alpha 255 where the
  // file has none; no gamma step is asked for, so none is made.
  png_set_expand(r.png);
  png_set_scale_16(r.png);
  png_set_gray_to_rgb(r.png);
  png_set_bgr(r.png);
  png_set_filler(r.png, 0xFF, PNG_FILLER_AFTER);
  png_set_interlace_handling(r.png);
  png_read_update_info(r.png, r.info);
  if (png_get_rowbytes(r.png, r.info) != static_cast<png_size_t>(width) * sizeof(Pixel)) {
    png_error(r.png, "unexpected row layout");
  }
  result.SetSize(static_cast<int>(width), static_cast<int>(height));
  rows.resize(static_cast<std::size_t>(height));
  for (int y = 0; y < static_cast<int>(height); ++y) {
    rows[static_cast<std::size_t>(y)] = reinterpret_cast<png_bytep>(result.ScanLine(y));
  }
  png_read_image(r.png, rows.data());
  return true;
}

}  // namespace

Bitmap32 DecodePng(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The PNG file is empty");
  if (data.size() < 8 || png_sig_cmp(data.data(), 0, 8) != 0) {
    throw PictureFileError("The file is not a valid PNG picture (no PNG signature)");
  }
  PngSource source{data};
  PngReader r;
  r.png = png_create_read_struct(PNG_LIBPNG_VER_STRING, &source, OnError, OnWarning);
  if (r.png != nullptr) r.info = png_create_info_struct(r.png);
  if (r.png == nullptr || r.info == nullptr) throw PictureFileError("Out of memory");
  Bitmap32 result;
  std::vector<png_bytep> rows;
  std::string sizeProblem;
  if (!RunPngDecoder(r, source, maxPixels, result, rows, sizeProblem)) {
    throw PictureFileError(source.headerRead
                               ? std::string("Cannot read the PNG picture: ") + source.message
                               : std::string("The file is not a valid PNG picture (") +
                                     source.message + ")");
  }
  if (!sizeProblem.empty()) throw PictureFileError(sizeProblem);
  return result;
}

}  // namespace quillane::codecs
