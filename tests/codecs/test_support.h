// Helpers for the codec tests: a fresh folder per test, little-endian byte building and
// small pictures with known pixels.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"
#include "imaging/bitmap32.h"

namespace quillane::testing {

class TempFolder : public ::testing::Test {
 protected:
  void SetUp() override;
  void TearDown() override;
  std::string Path(const std::string& name) const { return (folder_ / name).string(); }
  // Names of the entries in the folder, sorted.
  std::vector<std::string> Entries() const;

  std::filesystem::path folder_;
};

struct ByteWriter {
  std::vector<std::uint8_t> bytes;
  ByteWriter& U8(unsigned v) {
    bytes.push_back(static_cast<std::uint8_t>(v));
    return *this;
  }
  ByteWriter& U16(unsigned v) { return U8(v & 0xFF).U8((v >> 8) & 0xFF); }
  ByteWriter& U32(std::uint32_t v) { return U16(v & 0xFFFF).U16(v >> 16); }
  ByteWriter& I16(int v) { return U16(static_cast<std::uint16_t>(v)); }
  ByteWriter& I32(std::int32_t v) { return U32(static_cast<std::uint32_t>(v)); }
  ByteWriter& F32(float v);
  ByteWriter& Append(const std::vector<std::uint8_t>& more) {
    bytes.insert(bytes.end(), more.begin(), more.end());
    return *this;
  }
  ByteWriter& Text(const std::string& text) {
    bytes.insert(bytes.end(), text.begin(), text.end());
    return *this;
  }
  std::size_t Size() const { return bytes.size(); }
  void PatchU32(std::size_t at, std::uint32_t v) {
    for (int i = 0; i < 4; ++i) bytes[at + i] = static_cast<std::uint8_t>(v >> (8 * i));
  }
};

void WriteBytes(const std::string& path, const std::vector<std::uint8_t>& bytes);

// For a death test's child: lets the process grow by only extraBytes of address space.
void LimitAddressSpaceGrowth(std::uint64_t extraBytes);
// AddressSanitizer reserves terabytes of address space up front, so no limit can be set there.
#if defined(__SANITIZE_ADDRESS__)
#define QUILLANE_SKIP_UNDER_ADDRESS_LIMIT() GTEST_SKIP() << "no address-space limit under ASan"
#else
#define QUILLANE_SKIP_UNDER_ADDRESS_LIMIT() (void)0
#endif
std::vector<std::uint8_t> ReadBytes(const std::string& path);

// The message of the PictureFileError that f throws, or "" when it returns.
template <typename F>
std::string ErrorOf(F&& f) {
  try {
    f();
  } catch (const PictureFileError& error) {
    return error.what();
  }
  return "";
}
inline bool Contains(const std::string& text, const std::string& part) {
  return !part.empty() && text.find(part) != std::string::npos;
}

constexpr Pixel kRed{0, 0, 255, 255};
constexpr Pixel kGreen{0, 255, 0, 255};
constexpr Pixel kBlue{255, 0, 0, 255};
constexpr Pixel kWhite{255, 255, 255, 255};
constexpr Pixel kBlack{0, 0, 0, 255};

// A picture with every pixel different: gradients plus a little deterministic noise, alpha
// 255 unless given.
Bitmap32 PatternPicture(int width, int height, std::uint8_t alpha = 255);
// Largest per-channel difference of the colour bytes; the sizes must match.
int MaxColourDifference(const Bitmap32& a, const Bitmap32& b);
bool SameColours(const Bitmap32& a, const Bitmap32& b);

// A BMP file around a given info header, palette or masks, and pixel bytes.
std::vector<std::uint8_t> BmpFile(const std::vector<std::uint8_t>& infoHeader,
                                  const std::vector<std::uint8_t>& palette,
                                  const std::vector<std::uint8_t>& bits);
// A 40-, 108- or 124-byte info header. Masks go into v4/v5 headers.
std::vector<std::uint8_t> BmpInfoHeader(int headerSize, int width, int height, int bitCount,
                                        std::uint32_t compression, std::uint32_t imageSize,
                                        std::uint32_t colours = 0,
                                        std::vector<std::uint32_t> masks = {});

// GIF: a palette of RGB triples, indices row by row; transparent < 0 for none.
std::vector<std::uint8_t> GifFile(int screenWidth, int screenHeight, int left, int top, int width,
                                  int height, const std::vector<std::uint8_t>& paletteRgb,
                                  const std::vector<std::uint8_t>& indices, int transparent,
                                  int minCodeSize = 0);  // 0: the palette's bits, at least 2
// The same with the frame's LZW data given as it is.
std::vector<std::uint8_t> GifFileWithData(int screenWidth, int screenHeight, int left, int top,
                                          int width, int height,
                                          const std::vector<std::uint8_t>& paletteRgb,
                                          int minCodeSize, const std::vector<std::uint8_t>& lzw,
                                          int transparent = -1);
// LZW data of count pixels of one index, as compact as LZW gets (each code one pixel longer
// than the one before, up to the full table), so that tens of megapixels take kilobytes.
std::vector<std::uint8_t> LzwUniform(std::uint64_t count, unsigned index, int minCodeSize);

}  // namespace quillane::testing
