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

// A run-length bitmap draws its pixels with runs of at most 255 pixels, two bytes each, and may
// skip the rest of a row, jump ahead or stop early; skipped pixels are not in the file. A few
// bytes of end-of-bitmap code once opened as a 16384 by 16384 picture of nothing, so the runs
// must draw at least half of the picture: real encoders draw all of it. Returns the pixels the
// runs draw, counting no further than enough.
std::uint64_t RunLengthPixels(Bytes data, std::uint64_t start, bool fourBit, std::uint64_t enough) {
  std::uint64_t drawn = 0;
  std::uint64_t at = start;
  while (at + 1 < data.size() && drawn < enough) {
    const unsigned count = data[at], code = data[at + 1];
    at += 2;
    if (count > 0) {
      drawn += count;
    } else if (code == 1) {
      break;  // end of bitmap
    } else if (code == 2) {
      at += 2;  // delta: a jump, nothing drawn
    } else if (code >= 3) {
      drawn += code;
      const std::uint64_t bytes = fourBit ? (code + 1) / 2 : code;
      at += (bytes + 1) / 2 * 2;  // absolute runs are padded to whole words
    }
  }
  return drawn;
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
  constexpr std::uint32_t kRgb = 0, kRle8 = 1, kRle4 = 2, kBitFields = 3, kAlphaBitFields = 6;
  if ((compression == kRle8 || compression == kRle4) && width > 0 && height > 0) {
    const std::uint64_t pixels =
        static_cast<std::uint64_t>(width) * static_cast<std::uint64_t>(height);
    const std::uint64_t start = std::max<std::uint64_t>(bitsOffset, 14 + std::uint64_t{infoSize});
    const std::uint64_t drawn = RunLengthPixels(data, start, compression == kRle4, pixels / 2);
    if (drawn < pixels / 2) {
      throw PictureFileError("The bitmap file is damaged (its run-length data draws " +
                             std::to_string(drawn) + " of its " + std::to_string(width) + " by " +
                             std::to_string(height) + " pixels)");
    }
  }
  CheckPictureSize(width, height, maxPixels, "bitmap");
  // Uncompressed rows must all be there (the padding of the very last row may be missing).
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

// The pixels a GIF frame's LZW data gives, from the sub-blocks starting at at, counting no
// further than enough. Only the length of each code's string is followed, not the string, so
// this costs a few operations a code. Counting stops at the end code, at the end of the data or
// at a code the table does not hold yet (where a decoder stops too).
std::uint64_t LzwPixels(Bytes data, std::size_t at, int minCodeSize, std::uint64_t enough) {
  constexpr unsigned kTableSize = 4096;
  std::vector<std::uint16_t> lengths(kTableSize, 1);
  const unsigned clear = 1u << minCodeSize, end = clear + 1;
  unsigned width = minCodeSize + 1, next = clear + 2;
  int previous = -1;
  std::uint32_t bits = 0;
  unsigned held = 0;
  std::size_t blockLeft = 0;
  std::uint64_t pixels = 0;
  while (pixels < enough) {
    while (held < width) {
      if (blockLeft == 0) {
        if (at >= data.size() || data[at] == 0) return pixels;
        blockLeft = data[at++];
      }
      if (at >= data.size()) return pixels;
      bits |= std::uint32_t{data[at++]} << held;
      held += 8;
      --blockLeft;
    }
    const unsigned code = bits & ((1u << width) - 1);
    bits >>= width;
    held -= width;
    if (code == clear) {
      width = minCodeSize + 1;
      next = clear + 2;
      previous = -1;
      continue;
    }
    if (code == end) return pixels;
    unsigned length;
    if (previous < 0) {
      if (code >= clear) return pixels;
      length = 1;
    } else if (code < next && code != clear && code != end) {
      length = lengths[code];
    } else if (code == next) {
      length = lengths[previous] + 1u;
    } else {
      return pixels;
    }
    if (previous >= 0 && next < kTableSize) {
      lengths[next] = static_cast<std::uint16_t>(lengths[previous] + 1u);
      ++next;
      if (next == (1u << width) && width < 12) ++width;
    }
    pixels += length;
    previous = static_cast<int>(code);
  }
  return pixels;
}

// Qt renders a GIF's first frame on the whole logical screen that the header declares. The
// screen beyond the frame is only background (transparent, shown white), so it is not evidence
// of anything: a 27 KB file claiming a 16000 by 16000 screen would take gigabytes. The screen is
// honoured (the first frame at its place, the rest transparent) while it is at most
// kScreenPixelsFree pixels or four times the frame; beyond that it
// is cut back to the frame's right and bottom edges, and if even that is too much of nothing,
// to the frame itself. The changes are made in a copy handed to the reader. The frame must be
// there: its LZW data has to give at least half its pixels (some files lose their tail, and
// decoders show the rest as background). Headers that no encoder writes are refused on the way:
// another signature, or an LZW minimum code size of 12 or more, which leaves no room in the
// 12-bit code table.
constexpr std::int64_t kScreenPixelsFree = std::int64_t{1} << 22;

struct FittedGif {
  std::vector<std::uint8_t> bytes;
  std::int64_t left = 0, top = 0, width = 0, height = 0;  // the first frame on the screen
};

FittedGif GifWithFittedScreen(Bytes data, std::int64_t maxPixels) {
  const auto bad = [](const std::string& why) {
    return PictureFileError("The file is not a valid GIF picture (" + why + ")");
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
    const int minCodeSize = data[codeSizeAt];
    if (minCodeSize >= 12) throw bad("its LZW code size is 12 bits or more");
    const std::int64_t left = Little(data, at + 1, 2), top = Little(data, at + 3, 2);
    const std::int64_t frameWidth = Little(data, at + 5, 2), frameHeight = Little(data, at + 7, 2);
    const std::int64_t framePixels = frameWidth * frameHeight;
    const std::uint64_t given = LzwPixels(data, codeSizeAt + 1, std::max(minCodeSize, 2),
                                          static_cast<std::uint64_t>(framePixels + 1) / 2);
    if (framePixels > 0 && given < static_cast<std::uint64_t>(framePixels + 1) / 2) {
      throw PictureFileError("The GIF file is damaged (its picture data gives " +
                             std::to_string(given) + " of the first frame's " +
                             std::to_string(frameWidth) + " by " + std::to_string(frameHeight) +
                             " pixels)");
    }
    const std::int64_t allowed = std::max(kScreenPixelsFree, 4 * framePixels);
    std::int64_t width = Little(data, 6, 2), height = Little(data, 8, 2);
    std::int64_t frameLeft = left, frameTop = top;
    if (width * height > allowed) {
      width = std::min(width, left + frameWidth);
      height = std::min(height, top + frameHeight);
    }
    if (width * height > allowed) {
      width = frameWidth;
      height = frameHeight;
      frameLeft = frameTop = 0;
    }
    constexpr int kReaderBytesPerPixel = 8;
    CheckPictureSize(width, height, maxPixels, "GIF", kReaderBytesPerPixel);
    std::vector<std::uint8_t> fitted(data.begin(), data.end());
    std::uint8_t* size = fitted.data() + 6;
    Put16(size, static_cast<std::uint16_t>(width));
    Put16(size, static_cast<std::uint16_t>(height));
    std::uint8_t* place = fitted.data() + at + 1;
    Put16(place, static_cast<std::uint16_t>(frameLeft));
    Put16(place, static_cast<std::uint16_t>(frameTop));
    return {std::move(fitted), frameLeft, frameTop, frameWidth, frameHeight};
  }
}

// Qt fills the screen around the first frame with the background colour unless the frame has
// a transparent colour. The background colour is a relic that browsers and other readers
// ignore: the screen outside the frame is transparent, as with a transparent colour.
void ClearOutside(Bitmap32& screen, const FittedGif& frame) {
  for (int y = 0; y < screen.Height(); ++y) {
    Pixel* row = screen.ScanLine(y);
    const bool rowInside = y >= frame.top && y < frame.top + frame.height;
    for (int x = 0; x < screen.Width(); ++x) {
      if (rowInside && x >= frame.left && x < frame.left + frame.width) continue;
      row[x] = Pixel{0, 0, 0, 0};
    }
  }
}

}  // namespace

Bitmap32 DecodeWithQt(Bytes data, QtFormat format, std::int64_t maxPixels) {
  const char* family = FamilyName(format);
  if (data.empty()) throw PictureFileError(std::string("The ") + family + " file is empty");
  if (data.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
    throw PictureFileError(std::string("The ") + family + " file is too large");
  }
  FittedGif fittedGif;
  if (format == QtFormat::kGif) {
    fittedGif = GifWithFittedScreen(data, maxPixels);
    data = fittedGif.bytes;
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
  // Qt's GIF reader tells the first frame's size but renders the whole screen.
  const std::int64_t screen =
      format == QtFormat::kGif ? std::int64_t{Little(data, 6, 2)} * Little(data, 8, 2) : 0;
  LimitQtAllocation(std::max(size.width() * height, screen));

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
  if (format == QtFormat::kGif) ClearOutside(result, fittedGif);
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
