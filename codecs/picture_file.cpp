#include "codecs/picture_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstring>
#include <new>

#include "codecs/atomic_file.h"
#include "codecs/codec_internal.h"
#include "imaging/memory_budget.h"

namespace quillane {
namespace {

std::atomic<std::int64_t> maxPicturePixels{kDefaultMaxPicturePixels};

}  // namespace

std::int64_t MaxPicturePixels() {
  return maxPicturePixels.load(std::memory_order_relaxed);
}

void SetMaxPicturePixels(std::int64_t pixels) {
  maxPicturePixels.store(std::clamp<std::int64_t>(pixels, 1, Bitmap32::kMaxPixels),
                         std::memory_order_relaxed);
}

namespace codecs {

void CheckPictureSize(std::int64_t width, std::int64_t height, std::int64_t maxPixels,
                      const char* what, int extraBytesPerPixel) {
  const std::string size = std::to_string(width) + " by " + std::to_string(height);
  if (width <= 0 || height <= 0) {
    throw PictureFileError(std::string("The ") + what + " picture has no valid size (" + size +
                           ")");
  }
  // Each side is at most 2^32 here, so the product cannot overflow.
  if (width > 0xFFFFFFFFll || height > 0xFFFFFFFFll || width * height > maxPixels) {
    // Only a limit below what a bitmap can hold can be raised.
    const bool fitsBitmap = width <= Bitmap32::kMaxPixels && height <= Bitmap32::kMaxPixels &&
                            width * height <= Bitmap32::kMaxPixels;
    const std::string raise =
        maxPixels < Bitmap32::kMaxPixels && fitsBitmap
            ? " (quillane-cli --max-pixels " + std::to_string(width * height) +
                  " raises the limit, up to " + std::to_string(Bitmap32::kMaxPixels) + ")"
            : std::string();
    throw PictureFileError(std::string("The ") + what + " picture is " + size +
                           " pixels, more than the " + std::to_string(maxPixels) +
                           " pixels a picture may have" + raise);
  }
  try {
    CheckMemoryFor(width, height, std::string("The ") + what + " picture", extraBytesPerPixel);
  } catch (const NotEnoughMemory& e) {
    throw PictureFileError(e.what());
  }
}

std::vector<std::uint8_t> ReadWholeFile(const std::string& path) {
  // Far beyond the largest picture file of any accepted size.
  constexpr std::int64_t kMaxFileSize = std::int64_t{2} << 30;
  auto fail = [&](int error) {
    return PictureFileError("Cannot read \"" + path + "\": " + std::strerror(error));
  };
  const int fd = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
  if (fd < 0) {
    if (errno == ENXIO) throw PictureFileError(path + " is not a picture file");  // a socket
    throw fail(errno);
  }
  struct Closer {
    int fd;
    ~Closer() { ::close(fd); }
  } closer{fd};
  struct stat info {};
  if (::fstat(fd, &info) != 0) throw fail(errno);
  if (!S_ISREG(info.st_mode)) throw PictureFileError(path + " is not a picture file");
  if (info.st_size > kMaxFileSize) {
    throw PictureFileError("\"" + path + "\" is too large to be a picture");
  }
  std::vector<std::uint8_t> bytes(static_cast<std::size_t>(info.st_size));
  std::size_t done = 0;
  while (done < bytes.size()) {
    const ssize_t got = ::read(fd, bytes.data() + done, bytes.size() - done);
    if (got < 0) {
      if (errno == EINTR) continue;
      throw fail(errno);
    }
    if (got == 0) break;  // the file shrank while being read
    done += static_cast<std::size_t>(got);
  }
  bytes.resize(done);
  return bytes;
}

std::string SniffFamily(Bytes data) {
  auto starts = [&](std::initializer_list<std::uint8_t> head) {
    return data.size() >= head.size() && std::equal(head.begin(), head.end(), data.begin());
  };
  if (starts({0xFF, 0xD8, 0xFF})) return "JPEG";
  if (starts({0x89, 'P', 'N', 'G'})) return "PNG";
  if (starts({'G', 'I', 'F', '8'})) return "GIF";
  if (starts({'B', 'M'})) return "bitmap";
  if (starts({0, 0, 1, 0})) return "icon";
  if (starts({0xD7, 0xCD, 0xC6, 0x9A}) || starts({1, 0, 9, 0}) || starts({2, 0, 9, 0}) ||
      LooksLikeEnhancedMetafile(data))
    return "metafile";
  return "";
}

Bitmap32 DecodeByContent(Bytes data, std::int64_t maxPixels) {
  const std::string family = SniffFamily(data);
  if (family == "JPEG") return DecodeJpeg(data, maxPixels);
  if (family == "PNG") return DecodePng(data, maxPixels);
  if (family == "GIF") return DecodeWithQt(data, QtFormat::kGif, maxPixels);
  if (family == "bitmap") return DecodeWithQt(data, QtFormat::kBitmap, maxPixels);
  if (family == "icon") return DecodeWithQt(data, QtFormat::kIcon, maxPixels);
  if (family == "metafile") return DecodeMetafile(data, maxPixels);
  throw PictureFileError("The data is not a picture of any type the program reads");
}

std::uint64_t Dib24BitsSize(const Bitmap32& picture) {
  const std::uint64_t stride = (static_cast<std::uint64_t>(picture.Width()) * 3 + 3) / 4 * 4;
  return stride * static_cast<std::uint64_t>(picture.Height());
}

void WriteDib24(const Bitmap32& picture, ByteSink& sink) {
  const auto w = static_cast<std::uint32_t>(picture.Width());
  const auto h = static_cast<std::uint32_t>(picture.Height());
  std::uint8_t header[kDibInfoHeaderSize] = {};
  std::uint8_t* at = header;
  Put32(at, kDibInfoHeaderSize);
  Put32(at, w);
  Put32(at, h);  // positive: bottom-up
  Put16(at, 1);
  Put16(at, 24);
  Put32(at, 0);  // BI_RGB
  Put32(at, static_cast<std::uint32_t>(Dib24BitsSize(picture)));
  Put32(at, 3780);  // 96 dpi in pixels per metre
  Put32(at, 3780);
  Put32(at, 0);
  Put32(at, 0);
  sink.Write(header, sizeof header);

  const std::uint64_t stride = (std::uint64_t{w} * 3 + 3) / 4 * 4;
  std::vector<std::uint8_t> row(static_cast<std::size_t>(stride), 0);
  for (std::int64_t y = h; y-- > 0;) {
    const Pixel* source = picture.ScanLine(static_cast<int>(y));
    for (std::uint32_t x = 0; x < w; ++x) {
      row[3 * x] = source[x].b;
      row[3 * x + 1] = source[x].g;
      row[3 * x + 2] = source[x].r;
    }
    sink.Write(row.data(), row.size());
  }
}

// A bitmap file: the 14-byte file header, then the 24-bit DIB.
void EncodeBitmap24(const Bitmap32& picture, ByteSink& sink) {
  if (picture.Empty()) throw PictureFileError("There is no picture to save");
  constexpr std::uint32_t kFileHeaderSize = 14;
  const std::uint64_t fileSize = kFileHeaderSize + kDibInfoHeaderSize + Dib24BitsSize(picture);
  if (fileSize > 0xFFFFFFFFull) throw PictureFileError("The picture is too large for a bitmap");

  std::uint8_t header[kFileHeaderSize] = {};
  std::uint8_t* at = header;
  *at++ = 'B';
  *at++ = 'M';
  Put32(at, static_cast<std::uint32_t>(fileSize));
  Put32(at, 0);
  Put32(at, kFileHeaderSize + kDibInfoHeaderSize);
  sink.Write(header, sizeof header);
  WriteDib24(picture, sink);
}

// The same file with 32 bits per pixel: rows are the picture's own B, G, R, A bytes, never
// padded, still bottom-up and uncompressed (BI_RGB), as the desktop's wallpaper readers expect.
void EncodeBitmap32(const Bitmap32& picture, ByteSink& sink) {
  if (picture.Empty()) throw PictureFileError("There is no picture to save");
  constexpr std::uint32_t kFileHeaderSize = 14;
  const std::uint64_t bitsSize = static_cast<std::uint64_t>(picture.Width()) * 4 *
                                 static_cast<std::uint64_t>(picture.Height());
  const std::uint64_t fileSize = kFileHeaderSize + kDibInfoHeaderSize + bitsSize;
  if (fileSize > 0xFFFFFFFFull) throw PictureFileError("The picture is too large for a bitmap");

  std::uint8_t header[kFileHeaderSize + kDibInfoHeaderSize] = {};
  std::uint8_t* at = header;
  *at++ = 'B';
  *at++ = 'M';
  Put32(at, static_cast<std::uint32_t>(fileSize));
  Put32(at, 0);
  Put32(at, kFileHeaderSize + kDibInfoHeaderSize);
  Put32(at, kDibInfoHeaderSize);
  Put32(at, static_cast<std::uint32_t>(picture.Width()));
  Put32(at, static_cast<std::uint32_t>(picture.Height()));  // positive: bottom-up
  Put16(at, 1);
  Put16(at, 32);
  Put32(at, 0);  // BI_RGB
  Put32(at, static_cast<std::uint32_t>(bitsSize));
  Put32(at, 3780);  // 96 dpi in pixels per metre
  Put32(at, 3780);
  Put32(at, 0);
  Put32(at, 0);
  sink.Write(header, sizeof header);
  const std::size_t rowBytes = static_cast<std::size_t>(picture.Width()) * sizeof(Pixel);
  for (int y = picture.Height(); y-- > 0;) sink.Write(picture.ScanLine(y), rowBytes);
}

}  // namespace codecs

namespace {

bool Exists(const std::string& path) {
  struct stat info {};
  return ::stat(path.c_str(), &info) == 0;
}

// Every failure names the file, and one whose content is another known family says so: a JPEG
// under a .gif name is otherwise only "not a valid GIF picture".
template <typename Decoder>
std::optional<Bitmap32> Decode(const std::string& path, const char* family, Decoder decode) {
  if (!Exists(path)) return std::nullopt;
  std::vector<std::uint8_t> bytes;
  try {
    bytes = codecs::ReadWholeFile(path);
    return decode(codecs::Bytes(bytes));
  } catch (const PictureFileError& error) {
    std::string text = error.what();
    const std::string found = codecs::SniffFamily(bytes);
    if (!found.empty() && found != family) {
      text = "the file holds a " + found + " picture, not a " + family + " one (" + text + ")";
    }
    if (text.find(path) != std::string::npos) throw;
    throw PictureFileError("\"" + path + "\": " + text);
  } catch (const std::bad_alloc&) {
    throw PictureFileError("\"" + path + "\": there is not enough memory to open the picture (" +
                           MemoryAmount(AvailableMemory()) + " are available)");
  }
}

template <typename Encoder>
void SaveAtomically(const Bitmap32& picture, const std::string& path, Encoder encode,
                    LinkAtTarget links = LinkAtTarget::Follow) {
  const std::string prefix = "Cannot save \"" + path + "\": ";
  if (picture.Empty()) throw PictureFileError(prefix + "there is no picture to save");
  try {
    codecs::AtomicFile file(path, links);
    encode(file);
    file.Commit();
  } catch (const PictureFileError& error) {
    throw PictureFileError(prefix + error.what());
  } catch (const std::bad_alloc&) {
    throw PictureFileError(prefix + "there is not enough memory");
  }
}

}  // namespace

std::optional<Bitmap32> LoadPictureFile(const std::string& path, const LoaderNotice& notice) {
  const std::string key = AsciiLower(path.size() > 4 ? path.substr(path.size() - 4) : path);
  using codecs::Bytes;
  using codecs::QtFormat;
  if (key == ".bmp") {
    return Decode(path, "bitmap", [](Bytes b) { return DecodeWithQt(b, QtFormat::kBitmap); });
  }
  if (key == ".ico") {
    try {
      return Decode(path, "icon", [](Bytes b) { return DecodeWithQt(b, QtFormat::kIcon); });
    } catch (const std::exception& error) {
      if (notice) notice("Exit", "Input picture" + path + "Error." + error.what());
      return Bitmap32();
    }
  }
  if (key == ".jpg" || key == "jpeg") {
    return Decode(path, "JPEG", [](Bytes b) { return codecs::DecodeJpeg(b); });
  }
  if (key == ".gif") {
    return Decode(path, "GIF", [](Bytes b) { return DecodeWithQt(b, QtFormat::kGif); });
  }
  if (key == ".wmf" || key == ".emf") {
    return Decode(path, "metafile", [](Bytes b) { return codecs::DecodeMetafile(b); });
  }
  if (!Exists(path)) return std::nullopt;
  return Bitmap32();
}

std::optional<Bitmap32> LoadPng(const std::string& path) {
  return Decode(path, "PNG", [](codecs::Bytes b) { return codecs::DecodePng(b); });
}

void SaveJpeg(const Bitmap32& picture, const std::string& path, int quality) {
  SaveAtomically(picture, path, [&](codecs::ByteSink& sink) {
    const std::vector<std::uint8_t> bytes = codecs::EncodeJpeg(picture, quality);
    sink.Write(bytes.data(), bytes.size());
  });
}

void SaveJpeg(const Bitmap32& picture, const std::string& path, int quality, LinkAtTarget links) {
  SaveAtomically(
      picture, path,
      [&](codecs::ByteSink& sink) {
        const std::vector<std::uint8_t> bytes = codecs::EncodeJpeg(picture, quality);
        sink.Write(bytes.data(), bytes.size());
      },
      links);
}

void SavePng(const Bitmap32& picture, const std::string& path, LinkAtTarget links) {
  SaveAtomically(
      picture, path,
      [&](codecs::ByteSink& sink) {
        const std::vector<std::uint8_t> bytes = codecs::EncodePng(picture);
        sink.Write(bytes.data(), bytes.size());
      },
      links);
}

void SaveTextFile(const std::string& text, const std::string& path, LinkAtTarget links) {
  try {
    codecs::AtomicFile file(path, links);
    file.Write(text.data(), text.size());
    file.Commit();
  } catch (const PictureFileError& error) {
    throw PictureFileError("Cannot save \"" + path + "\": " + error.what());
  }
}

void SaveBitmap24(const Bitmap32& picture, const std::string& path) {
  SaveAtomically(picture, path,
                 [&](codecs::ByteSink& sink) { codecs::EncodeBitmap24(picture, sink); });
}

void SaveBitmap32(const Bitmap32& picture, const std::string& path) {
  SaveAtomically(picture, path,
                 [&](codecs::ByteSink& sink) { codecs::EncodeBitmap32(picture, sink); });
}

void SaveMetafile(const Bitmap32& picture, const std::string& path) {
  SaveAtomically(picture, path,
                 [&](codecs::ByteSink& sink) { codecs::EncodeEnhancedMetafile(picture, sink); });
}

void SavePng(const Bitmap32& picture, const std::string& path) {
  SaveAtomically(picture, path, [&](codecs::ByteSink& sink) {
    const std::vector<std::uint8_t> bytes = codecs::EncodePng(picture);
    sink.Write(bytes.data(), bytes.size());
  });
}

std::string ReplaceExtension(const std::string& name, const std::string& extension) {
  const auto last = name.find_last_of(".\\/:");
  if (last != std::string::npos && name[last] == '.') return name.substr(0, last) + extension;
  return name + extension;
}

std::string AsciiLower(std::string_view text) {
  std::string lower(text);
  for (char& c : lower)
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
  return lower;
}

}  // namespace quillane
