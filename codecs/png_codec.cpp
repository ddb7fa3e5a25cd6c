// PNG reading through libpng's simplified interface, which keeps its errors to itself (Qt's
// reader lets libpng print them on the terminal) and gives B, G, R, A bytes as Pixel holds them.
#include <png.h>

#include <algorithm>
#include <memory>
#include <string>

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
void CheckPngDataBacksPicture(Bytes data, const png_image& image) {
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
  const std::uint64_t rowBytes = (std::uint64_t{image.width} * depth * channels + 7) / 8 + 1;
  // libpng refuses sides beyond a million pixels, so this cannot overflow.
  const std::uint64_t rows = std::uint64_t{image.height} * rowBytes;
  if (idat <= kZlibWrapping || (idat - kZlibWrapping) * kDeflateMostPerByte < rows) {
    throw PictureFileError("The PNG file is truncated (" + std::to_string(idat) +
                           " bytes of picture data cannot hold a picture of " +
                           std::to_string(image.width) + " by " + std::to_string(image.height) +
                           " pixels)");
  }
}

}  // namespace

TBitmap32 DecodePng(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The PNG file is empty");
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  const std::unique_ptr<png_image, void (*)(png_imagep)> cleanup(&image, png_image_free);
  if (!png_image_begin_read_from_memory(&image, data.data(), data.size())) {
    throw PictureFileError(std::string("The file is not a valid PNG picture (") + image.message +
                           ")");
  }
  CheckPngDataBacksPicture(data, image);
  CheckPictureSize(image.width, image.height, maxPixels, "PNG");
  image.format = PNG_FORMAT_BGRA;
  TBitmap32 result(static_cast<int>(image.width), static_cast<int>(image.height));
  if (!png_image_finish_read(&image, nullptr, result.Data(), 0, nullptr)) {
    throw PictureFileError(std::string("Cannot read the PNG picture: ") + image.message);
  }
  return result;
}

}  // namespace quillane::codecs
