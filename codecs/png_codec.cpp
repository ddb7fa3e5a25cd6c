// PNG reading through libpng's simplified interface, which keeps its errors to itself (Qt's
// reader lets libpng print them on the terminal) and gives B, G, R, A bytes as Pixel holds them.
#include <png.h>

#include <memory>

#include "codecs/codec_internal.h"

namespace quillane::codecs {

Bitmap32 DecodePng(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The PNG file is empty");
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  const std::unique_ptr<png_image, void (*)(png_imagep)> cleanup(&image, png_image_free);
  if (!png_image_begin_read_from_memory(&image, data.data(), data.size())) {
    throw PictureFileError(std::string("The file is not a valid PNG picture (") + image.message +
                           ")");
  }
  CheckPictureSize(image.width, image.height, maxPixels, "PNG");
  image.format = PNG_FORMAT_BGRA;
  Bitmap32 result(static_cast<int>(image.width), static_cast<int>(image.height));
  if (!png_image_finish_read(&image, nullptr, result.Data(), 0, nullptr)) {
    throw PictureFileError(std::string("Cannot read the PNG picture: ") + image.message);
  }
  return result;
}

}  // namespace quillane::codecs
