// Bitmaps, icons and GIFs through Qt's image readers; PNG writing through Qt's writer.
#include <QBuffer>
#include <QByteArray>
#include <QImage>
#include <QImageReader>
#include <QImageWriter>
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <limits>

#include "codecs/codec_internal.h"

namespace quillane::codecs {
namespace {

const char* FormatName(QtFormat format) {
  switch (format) {
    case QtFormat::kBitmap:
      return "bmp";
    case QtFormat::kIcon:
      return "ico";
    case QtFormat::kGif:
      return "gif";
  }
  return "";
}

const char* FamilyName(QtFormat format) {
  switch (format) {
    case QtFormat::kBitmap:
      return "bitmap";
    case QtFormat::kIcon:
      return "icon";
    case QtFormat::kGif:
      return "GIF";
  }
  return "";
}

// Qt refuses decoded images above a process-wide limit (128 MB by default, less than a
// 50-megapixel photo in 32 bits). It is set for each picture to what the size checked from its
// header needs in 32 bits, so that content asking Qt for more than the header said is refused
// rather than allowed up to the largest picture the program accepts.
void LimitQtAllocation(std::int64_t pixels) {
  constexpr std::int64_t kMegabyte = 1024 * 1024;
  QImageReader::setAllocationLimit(static_cast<int>(pixels * 4 / kMegabyte + 1));
}

int BitDepth(QImage::Format format) {
  switch (format) {
    case QImage::Format_Mono:
    case QImage::Format_MonoLSB:
      return 1;
    case QImage::Format_Indexed8:
    case QImage::Format_Grayscale8:
      return 8;
    case QImage::Format_RGB16:
    case QImage::Format_RGB555:
      return 16;
    case QImage::Format_RGB888:
    case QImage::Format_BGR888:
      return 24;
    case QImage::Format_RGB32:
      return 24;  // 32 bits of storage but no alpha: an icon's alpha makes it deeper
    case QImage::Format_Invalid:
      return 0;
    default:
      return 32;
  }
}

// A directory of more entries than the file holds would have Qt look at (and warn about) each of
// up to 65535 made-up entries, tens of milliseconds a file (found by fuzzing).
void CheckIconDirectory(Bytes data) {
  if (data.size() < 6 ||
      6 + 16 * (std::size_t{data[4]} | std::size_t{data[5]} << 8) > data.size()) {
    throw PictureFileError("The file is not a valid icon picture (its directory is cut short)");
  }
}

// The largest entry wins, and of equally large ones the deepest; the first of equals.
int ChooseIconEntry(QImageReader& reader) {
  const int count = reader.imageCount();
  int best = -1;
  std::int64_t bestArea = -1;
  int bestDepth = -1;
  for (int i = 0; i < count; ++i) {
    if (!reader.jumpToImage(i)) continue;
    const QSize size = reader.size();
    if (!size.isValid()) continue;
    const std::int64_t area = std::int64_t{size.width()} * size.height();
    const int depth = BitDepth(reader.imageFormat());
    if (area > bestArea || (area == bestArea && depth > bestDepth)) {
      best = i;
      bestArea = area;
      bestDepth = depth;
    }
  }
  return best;
}

std::uint8_t OverWhite(unsigned channel, unsigned alpha) {
  // 255 is odd, so adding 127 before dividing rounds to nearest without ties.
  return static_cast<std::uint8_t>((channel * alpha + 255 * (255 - alpha) + 127) / 255);
}

void CompositeOverWhite(Bitmap32& bitmap) {
  for (int y = 0; y < bitmap.Height(); ++y) {
    Pixel* row = bitmap.ScanLine(y);
    for (int x = 0; x < bitmap.Width(); ++x) {
      Pixel& p = row[x];
      if (p.a == 255) continue;
      p = Pixel{OverWhite(p.b, p.a), OverWhite(p.g, p.a), OverWhite(p.r, p.a), p.a};
    }
  }
}

std::uint32_t Little(Bytes d, std::size_t at, int bytes) {
  std::uint32_t v = 0;
  for (int i = bytes - 1; i >= 0; --i) v = v << 8 | d[at + static_cast<std::size_t>(i)];
  return v;
}

// Qt's bitmap reader takes a top-down bitmap's size as negative and quietly fills the rows a
// truncated file lacks; both are settled here from the headers.
void CheckBitmapHeaders(Bytes data, std::int64_t maxPixels) {
  if (data.size() < 26 || data[0] != 'B' || data[1] != 'M') {
    throw PictureFileError("The file is not a valid bitmap picture");
  }
  const std::uint32_t bitsOffset = Little(data, 10, 4);
  const std::uint32_t infoSize = Little(data, 14, 4);
  std::int64_t width, height;
  std::uint32_t bitCount, compression = 0;
  if (infoSize == 12) {  // OS/2 core header
    width = Little(data, 18, 2);
    height = Little(data, 20, 2);
    bitCount = Little(data, 24, 2);
  } else {
    if (infoSize < 16 || data.size() < 34) {
      throw PictureFileError("The file is not a valid bitmap picture");
    }
    width = static_cast<std::int32_t>(Little(data, 18, 4));
    height = static_cast<std::int32_t>(Little(data, 22, 4));
    bitCount = Little(data, 28, 2);
    compression = Little(data, 30, 4);
  }
  if (height < 0) height = -height;  // top-down
  CheckPictureSize(width, height, maxPixels, "bitmap");
  // Uncompressed rows must all be there (the padding of the very last row may be missing).
  constexpr std::uint32_t kRgb = 0, kBitFields = 3, kAlphaBitFields = 6;
  if ((compression == kRgb || compression == kBitFields || compression == kAlphaBitFields) &&
      bitCount > 0 && bitCount <= 32) {
    const std::uint64_t rowBits = static_cast<std::uint64_t>(width) * bitCount;
    const std::uint64_t stride = (rowBits + 31) / 32 * 4;
    const std::uint64_t start = std::max<std::uint64_t>(bitsOffset, 14 + std::uint64_t{infoSize});
    const std::uint64_t needed =
        start + stride * static_cast<std::uint64_t>(height - 1) + (rowBits + 7) / 8;
    if (data.size() < needed) throw PictureFileError("The bitmap file is truncated");
  }
}

// Qt renders a GIF's first frame on the whole logical screen that the header declares, so a
// 27 KB file claiming a 16000 by 16000 screen would take gigabytes. The screen is cut back to
// the right and bottom edges of the first frame (what lies beyond them is only background), in
// a copy handed to the reader. Headers that no encoder writes are refused on the way: another
// signature, or an LZW code size above 8 bits, which Qt would quietly render as white.
std::vector<std::uint8_t> GifWithFittedScreen(Bytes data, std::int64_t maxPixels) {
  const auto bad = [](const char* why) {
    return PictureFileError(std::string("The file is not a valid GIF picture (") + why + ")");
  };
  if (data.size() < 13) throw bad("it ends inside its header");
  if (!std::equal(data.begin(), data.begin() + 6, "GIF87a") &&
      !std::equal(data.begin(), data.begin() + 6, "GIF89a"))
    throw bad("its signature is neither GIF87a nor GIF89a");
  const auto table = [](std::uint8_t flags) {
    return flags & 0x80 ? std::size_t{3} << ((flags & 7) + 1) : 0;
  };
  std::size_t at = 13 + table(data[10]);
  while (true) {
    if (at >= data.size()) throw bad("it holds no picture");
    if (data[at] == 0x21) {  // extension: label, then sub-blocks up to an empty one
      at += 2;
      while (at < data.size() && data[at] != 0) at += std::size_t{data[at]} + 1;
      ++at;
      continue;
    }
    if (data[at] != 0x2C) throw bad("it holds no picture");
    if (data.size() < at + 11) throw bad("it ends inside a frame header");
    const std::size_t codeSizeAt = at + 10 + table(data[at + 9]);
    if (codeSizeAt >= data.size()) throw bad("it ends inside a frame header");
    if (data[codeSizeAt] > 8) throw bad("its LZW code size is above 8 bits");
    const std::int64_t right = std::int64_t{Little(data, at + 1, 2)} + Little(data, at + 5, 2);
    const std::int64_t bottom = std::int64_t{Little(data, at + 3, 2)} + Little(data, at + 7, 2);
    const std::int64_t width = std::min<std::int64_t>(Little(data, 6, 2), right);
    const std::int64_t height = std::min<std::int64_t>(Little(data, 8, 2), bottom);
    constexpr int kReaderBytesPerPixel = 8;
    CheckPictureSize(width, height, maxPixels, "GIF", kReaderBytesPerPixel);
    std::vector<std::uint8_t> fitted(data.begin(), data.end());
    std::uint8_t* size = fitted.data() + 6;
    Put16(size, static_cast<std::uint16_t>(width));
    Put16(size, static_cast<std::uint16_t>(height));
    return fitted;
  }
}

}  // namespace

Bitmap32 DecodeWithQt(Bytes data, QtFormat format, std::int64_t maxPixels) {
  const char* family = FamilyName(format);
  if (data.empty()) throw PictureFileError(std::string("The ") + family + " file is empty");
  if (data.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
    throw PictureFileError(std::string("The ") + family + " file is too large");
  }
  std::vector<std::uint8_t> fittedGif;
  if (format == QtFormat::kGif) {
    fittedGif = GifWithFittedScreen(data, maxPixels);
    data = fittedGif;
  }
  // The reader only looks at the bytes; no copy is made.
  const QByteArray bytes = QByteArray::fromRawData(reinterpret_cast<const char*>(data.data()),
                                                   static_cast<qsizetype>(data.size()));
  QBuffer buffer;
  buffer.setData(bytes);
  buffer.open(QIODevice::ReadOnly);
  QImageReader reader(&buffer, FormatName(format));
  reader.setAutoDetectImageFormat(false);
  reader.setDecideFormatFromContent(false);
  reader.setAutoTransform(false);
  if (format == QtFormat::kBitmap) CheckBitmapHeaders(data, maxPixels);
  if (!reader.canRead()) {
    throw PictureFileError(std::string("The file is not a valid ") + family + " picture");
  }
  if (format == QtFormat::kIcon) {
    CheckIconDirectory(data);
    const int entry = ChooseIconEntry(reader);
    if (entry < 0 || !reader.jumpToImage(entry)) {
      throw PictureFileError("The icon file holds no readable picture");
    }
  }
  const QSize size = reader.size();
  // The reader's QImage and, for the formats it does not give in 32 bits, a converted copy.
  constexpr int kReaderBytesPerPixel = 8;
  const std::int64_t height = std::abs(std::int64_t{size.height()});
  CheckPictureSize(size.width(), height, maxPixels, family, kReaderBytesPerPixel);
  LimitQtAllocation(size.width() * height);

  QImage image;
  if (!reader.read(&image) || image.isNull()) {
    throw PictureFileError(std::string("Cannot read the ") + family +
                           " picture: " + reader.errorString().toStdString());
  }
  CheckPictureSize(image.width(), image.height(), maxPixels, family);
  if (image.format() != QImage::Format_ARGB32) {
    image.convertTo(QImage::Format_ARGB32);
    if (image.isNull()) throw PictureFileError("Out of memory");
  }
  Bitmap32 result(image.width(), image.height());
  const std::size_t rowBytes = static_cast<std::size_t>(image.width()) * sizeof(Pixel);
  for (int y = 0; y < image.height(); ++y) {
    std::memcpy(result.ScanLine(y), image.constScanLine(y), rowBytes);
  }
  if (format == QtFormat::kBitmap) WidenSixteenBitBitmap(data, result);
  if (format != QtFormat::kBitmap) CompositeOverWhite(result);
  return result;
}

std::vector<std::uint8_t> EncodePng(const Bitmap32& picture) {
  if (picture.Empty()) throw PictureFileError("There is no picture to save");
  const QImage image(reinterpret_cast<const uchar*>(picture.Data()), picture.Width(),
                     picture.Height(), static_cast<qsizetype>(picture.Width()) * 4,
                     QImage::Format_ARGB32);
  QByteArray bytes;
  QBuffer buffer(&bytes);
  buffer.open(QIODevice::WriteOnly);
  QImageWriter writer(&buffer, "png");
  if (!writer.write(image)) {
    throw PictureFileError("Cannot write the PNG picture: " + writer.errorString().toStdString());
  }
  return std::vector<std::uint8_t>(bytes.begin(), bytes.end());
}

}  // namespace quillane::codecs
