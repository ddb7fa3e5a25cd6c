// The decoders and encoders behind picture_file.h, working on bytes in memory so that the
// tests and the fuzz targets can drive each one directly.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "codecs/picture_file.h"
#include "imaging/bitmap32.h"

namespace quillane::codecs {

using Bytes = std::span<const std::uint8_t>;

// Receives encoded bytes as they are produced. Write throws PictureFileError on failure.
class ByteSink {
 public:
  virtual ~ByteSink() = default;
  virtual void Write(const void* data, std::size_t size) = 0;
};

class MemorySink : public ByteSink {
 public:
  void Write(const void* data, std::size_t size) override {
    const auto* bytes = static_cast<const std::uint8_t*>(data);
    bytes_.insert(bytes_.end(), bytes, bytes + size);
  }
  std::vector<std::uint8_t>& bytes() { return bytes_; }

 private:
  std::vector<std::uint8_t> bytes_;
};

// Every decoder refuses a picture of more than maxPixels (or of a width or height of 0 or
// below) from its header, before any pixel memory is allocated, and throws PictureFileError
// for anything it cannot read completely. Before that, each checks that the file holds enough
// data for the picture its header announces (run-length bitmap data, a GIF frame's LZW data, a
// JPEG's entropy-coded data and scans, a PNG's compressed rows) and refuses it as damaged or
// truncated when it cannot, so that a few bytes never cost gigabytes or minutes.

// JPEG through libjpeg-turbo: baseline, progressive, grayscale, RGB, CMYK and YCCK (Adobe
// files store inverted inks; both forms give the right colours). Alpha is 255. The picture is
// stood upright by the EXIF Orientation tag (exif_orientation.h) when the file has one.
Bitmap32 DecodeJpeg(Bytes data, std::int64_t maxPixels = MaxPicturePixels());

// The formats read through Qt's image readers, each with its own reader only (the content is
// not sniffed, so a PNG named .bmp is refused as a bad bitmap).
enum class QtFormat {
  kBitmap,  // every BMP depth, RLE4/RLE8, bit fields, top-down and bottom-up, v3 to v5 headers
  kIcon,    // the entry with the most pixels, and of those the deepest, is taken
  kGif,     // the first frame, on a screen no larger than the frames need (see qt_codec.cpp)
};
// For icons and GIFs, transparent and partly transparent pixels are composited over white (the
// background a freshly made bitmap shows); the alpha bytes are returned as the decoder gives
// them. Bitmaps keep their stored colours and alpha.
Bitmap32 DecodeWithQt(Bytes data, QtFormat format, std::int64_t maxPixels = MaxPicturePixels());
// For a 16-bit bitmap (BI_RGB 5-5-5, BI_BITFIELDS or BI_ALPHABITFIELDS) that Qt has decoded
// into picture, takes every pixel again from data with each field widened to the full range
// (bitmap16.cpp says how); any other file is left as it is.
void WidenSixteenBitBitmap(Bytes data, Bitmap32& picture);

// Metafiles are told apart by their content: an enhanced metafile starts with an EMR_HEADER
// record carrying the " EMF" signature; anything else must be a Windows metafile (placeable
// or not). The picture is played onto a white background; alpha is 255. Windows metafiles, and
// enhanced metafiles with more than bitmaps in them, are drawn in a separate, limited process
// (codecs/metafile_render.h); a file that keeps it drawing too long is refused.
Bitmap32 DecodeMetafile(Bytes data, std::int64_t maxPixels = MaxPicturePixels());
bool LooksLikeEnhancedMetafile(Bytes data);
Bitmap32 DecodeEnhancedMetafile(Bytes data, std::int64_t maxPixels = MaxPicturePixels());
Bitmap32 DecodeWindowsMetafile(Bytes data, std::int64_t maxPixels = MaxPicturePixels());

// Encoders. quality is clamped to 1..100.
std::vector<std::uint8_t> EncodeJpeg(const Bitmap32& picture, int quality);
void EncodeBitmap24(const Bitmap32& picture, ByteSink& sink);
void EncodeBitmap32(const Bitmap32& picture, ByteSink& sink);
void EncodeEnhancedMetafile(const Bitmap32& picture, ByteSink& sink);
std::vector<std::uint8_t> EncodePng(const Bitmap32& picture);

// Little-endian writers for building headers in a byte buffer.
inline void Put16(std::uint8_t*& at, std::uint16_t v) {
  *at++ = static_cast<std::uint8_t>(v);
  *at++ = static_cast<std::uint8_t>(v >> 8);
}
inline void Put32(std::uint8_t*& at, std::uint32_t v) {
  for (int i = 0; i < 4; ++i) *at++ = static_cast<std::uint8_t>(v >> (8 * i));
}

// A device-independent bitmap of 24 bits per pixel, bottom-up, as both the bitmap file and the
// metafile carry it: a 40-byte info header, then the rows in B, G, R order padded to four bytes.
inline constexpr std::size_t kDibInfoHeaderSize = 40;
std::uint64_t Dib24BitsSize(const Bitmap32& picture);
void WriteDib24(const Bitmap32& picture, ByteSink& sink);

// The pixel size a Windows playing device at 96 dots per inch gives an enhanced metafile.
inline constexpr int kMetafileDotsPerInch = 96;

// Reads a whole regular file. The file is opened without waiting (a FIFO or a device put in the
// file's place would otherwise block for good) and only then checked, so what is read is what
// was checked. Throws PictureFileError: "<path> is not a picture file" for anything but a
// regular file, and a reason naming the file when it cannot be read.
std::vector<std::uint8_t> ReadWholeFile(const std::string& path);

// Throws PictureFileError when a width by height picture cannot be held: a side of 0 or below,
// more than maxPixels, or more memory than is available for opening it and running an effect
// on it (the decoder's own buffers being extraBytesPerPixel).
void CheckPictureSize(std::int64_t width, std::int64_t height, std::int64_t maxPixels,
                      const char* what, int extraBytesPerPixel = 0);

// PNG through libpng's simplified reader, alpha kept as stored (not premultiplied). libpng's
// complaints become the error message; none goes to the terminal.
Bitmap32 DecodePng(Bytes data, std::int64_t maxPixels = MaxPicturePixels());

// The family a file's first bytes belong to ("JPEG", "PNG", "GIF", "bitmap", "icon",
// "metafile"), or "" when none is recognised.
std::string SniffFamily(Bytes data);

// A picture whose type is known only from its content, as standard input gives it: decoded by
// the decoder of the family SniffFamily finds. Throws PictureFileError for an unknown family and
// as each decoder does.
Bitmap32 DecodeByContent(Bytes data, std::int64_t maxPixels = MaxPicturePixels());

}  // namespace quillane::codecs
