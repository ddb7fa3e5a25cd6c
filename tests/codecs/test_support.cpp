#include "tests/codecs/test_support.h"

#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>

namespace quillane::testing {

void TempFolder::SetUp() {
  std::string pattern = (std::filesystem::temp_directory_path() / "codecs-test-XXXXXX").string();
  ASSERT_NE(::mkdtemp(pattern.data()), nullptr);
  folder_ = pattern;
}

void TempFolder::TearDown() {
  std::error_code ignored;
  std::filesystem::permissions(folder_, std::filesystem::perms::owner_all,
                               std::filesystem::perm_options::add, ignored);
  std::filesystem::remove_all(folder_, ignored);
}

std::vector<std::string> TempFolder::Entries() const {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(folder_)) {
    names.push_back(entry.path().filename().string());
  }
  std::sort(names.begin(), names.end());
  return names;
}

ByteWriter& ByteWriter::F32(float v) {
  std::uint32_t bits;
  std::memcpy(&bits, &v, sizeof bits);
  return U32(bits);
}

void WriteBytes(const std::string& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(bytes.data()),
            static_cast<std::streamsize>(bytes.size()));
  ASSERT_TRUE(out.good()) << path;
}

std::vector<std::uint8_t> ReadBytes(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return std::vector<std::uint8_t>(std::istreambuf_iterator<char>(in), {});
}

Bitmap32 PatternPicture(int width, int height, std::uint8_t alpha) {
  Bitmap32 picture(width, height);
  std::uint32_t noise = 12345;
  for (int y = 0; y < height; ++y) {
    Pixel* row = picture.ScanLine(y);
    for (int x = 0; x < width; ++x) {
      noise = noise * 1103515245u + 12345u;
      const int jitter = static_cast<int>((noise >> 16) % 7) - 3;
      row[x] = Pixel{
          static_cast<std::uint8_t>(std::clamp(x * 255 / std::max(1, width - 1) + jitter, 0, 255)),
          static_cast<std::uint8_t>(std::clamp(y * 255 / std::max(1, height - 1) + jitter, 0, 255)),
          static_cast<std::uint8_t>(std::clamp(128 + jitter * 9, 0, 255)), alpha};
    }
  }
  return picture;
}

int MaxColourDifference(const Bitmap32& a, const Bitmap32& b) {
  int worst = 0;
  for (int y = 0; y < a.Height(); ++y) {
    for (int x = 0; x < a.Width(); ++x) {
      const Pixel p = a.At(x, y), q = b.At(x, y);
      worst = std::max({worst, std::abs(p.b - q.b), std::abs(p.g - q.g), std::abs(p.r - q.r)});
    }
  }
  return worst;
}

bool SameColours(const Bitmap32& a, const Bitmap32& b) {
  return a.Width() == b.Width() && a.Height() == b.Height() && MaxColourDifference(a, b) == 0;
}

std::vector<std::uint8_t> BmpFile(const std::vector<std::uint8_t>& infoHeader,
                                  const std::vector<std::uint8_t>& palette,
                                  const std::vector<std::uint8_t>& bits) {
  const std::uint32_t offset = static_cast<std::uint32_t>(14 + infoHeader.size() + palette.size());
  ByteWriter w;
  w.bytes.reserve(offset + bits.size());
  w.U8('B').U8('M').U32(offset + static_cast<std::uint32_t>(bits.size())).U32(0).U32(offset);
  w.Append(infoHeader).Append(palette).Append(bits);
  return w.bytes;
}

std::vector<std::uint8_t> BmpInfoHeader(int headerSize, int width, int height, int bitCount,
                                        std::uint32_t compression, std::uint32_t imageSize,
                                        std::uint32_t colours, std::vector<std::uint32_t> masks) {
  ByteWriter w;
  w.U32(static_cast<std::uint32_t>(headerSize)).I32(width).I32(height).U16(1).U16(bitCount);
  w.U32(compression).U32(imageSize).U32(3780).U32(3780).U32(colours).U32(0);
  if (headerSize >= 108) {
    masks.resize(4, 0);
    for (std::uint32_t m : masks) w.U32(m);
    w.U32(0x73524742);                         // 'sRGB'
    for (int i = 0; i < 9 + 3; ++i) w.U32(0);  // endpoints and gamma
  }
  if (headerSize >= 124) w.U32(4).U32(0).U32(0).U32(0);  // intent, profile, reserved
  return w.bytes;
}

namespace {

// LZW codes packed least significant bit first, as GIF stores them.
struct CodeWriter {
  std::vector<std::uint8_t> out;
  std::uint64_t accumulator = 0;
  int bits = 0;
  void Emit(unsigned code, int width) {
    accumulator |= std::uint64_t{code} << bits;
    for (bits += width; bits >= 8; bits -= 8, accumulator >>= 8)
      out.push_back(static_cast<std::uint8_t>(accumulator & 0xFF));
  }
  std::vector<std::uint8_t> Finish(unsigned end, int width) {
    Emit(end, width);
    if (bits > 0) out.push_back(static_cast<std::uint8_t>(accumulator & 0xFF));
    return out;
  }
};

// LZW without compression: only literal codes, with a clear code often enough that the code
// width never grows. Every decoder reads this.
std::vector<std::uint8_t> LzwLiterals(const std::vector<std::uint8_t>& indices, int minCodeSize) {
  const unsigned clear = 1u << minCodeSize;
  const int width = minCodeSize + 1;
  CodeWriter w;
  for (std::size_t i = 0; i < indices.size(); ++i) {
    if (i % (clear - 2) == 0) w.Emit(clear, width);
    w.Emit(indices[i], width);
  }
  return w.Finish(clear + 1, width);
}

}  // namespace

void LimitAddressSpaceGrowth(std::uint64_t extraBytes) {
  std::ifstream statm("/proc/self/statm");
  std::uint64_t pages = 0;
  statm >> pages;
  rlimit limit{};
  ::getrlimit(RLIMIT_AS, &limit);
  limit.rlim_cur = pages * ::sysconf(_SC_PAGESIZE) + extraBytes;
  if (::setrlimit(RLIMIT_AS, &limit) != 0) std::abort();
}

std::vector<std::uint8_t> GifFileWithData(int screenWidth, int screenHeight, int left, int top,
                                          int width, int height,
                                          const std::vector<std::uint8_t>& paletteRgb,
                                          int minCodeSize, const std::vector<std::uint8_t>& lzw,
                                          int transparent) {
  int sizeBits = 1;
  while ((3u << sizeBits) < paletteRgb.size()) ++sizeBits;
  std::vector<std::uint8_t> palette = paletteRgb;
  palette.resize(3u << sizeBits, 0);
  ByteWriter w;
  w.Text("GIF89a").U16(screenWidth).U16(screenHeight);
  w.U8(0x80 | 0x70 | (sizeBits - 1)).U8(0).U8(0).Append(palette);
  if (transparent >= 0) {
    w.U8(0x21).U8(0xF9).U8(4).U8(1).U16(0).U8(transparent).U8(0);
  }
  w.U8(0x2C).U16(left).U16(top).U16(width).U16(height).U8(0);
  w.U8(minCodeSize);
  for (std::size_t at = 0; at < lzw.size(); at += 255) {
    const std::size_t n = std::min<std::size_t>(255, lzw.size() - at);
    w.U8(static_cast<unsigned>(n));
    w.bytes.insert(w.bytes.end(), lzw.begin() + at, lzw.begin() + at + n);
  }
  w.U8(0).U8(0x3B);
  return w.bytes;
}

std::vector<std::uint8_t> GifFile(int screenWidth, int screenHeight, int left, int top, int width,
                                  int height, const std::vector<std::uint8_t>& paletteRgb,
                                  const std::vector<std::uint8_t>& indices, int transparent,
                                  int minCodeSize) {
  int sizeBits = 1;
  while ((3u << sizeBits) < paletteRgb.size()) ++sizeBits;
  if (minCodeSize == 0) minCodeSize = std::max(2, sizeBits);
  return GifFileWithData(screenWidth, screenHeight, left, top, width, height, paletteRgb,
                         minCodeSize, LzwLiterals(indices, minCodeSize), transparent);
}

std::vector<std::uint8_t> LzwUniform(std::uint64_t count, unsigned index, int minCodeSize) {
  const unsigned clear = 1u << minCodeSize;
  unsigned next = clear + 2;
  int width = minCodeSize + 1;
  CodeWriter w;
  w.Emit(clear, width);
  // Entry clear + k (k >= 2) holds k pixels, the literal one.
  std::uint64_t previous = 0;  // pixels of the last code; 0 before the first
  while (count > 0) {
    std::uint64_t length = std::min<std::uint64_t>(previous + 1, count);
    if (next == 4096) length = std::min<std::uint64_t>(4095 - clear, count);
    w.Emit(length == 1 ? index : clear + static_cast<unsigned>(length), width);
    if (previous > 0 && next < 4096) {
      ++next;
      if (next == (1u << width) && width < 12) ++width;
    }
    previous = length;
    count -= length;
  }
  return w.Finish(clear + 1, width);
}

}  // namespace quillane::testing
