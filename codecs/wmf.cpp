// Windows metafiles through libwmf, played by its gd device in quillane-wmf-render, a process of
// its own: a hostile file can keep libwmf drawing for minutes inside a single record, or have it
// allocate without bound, and only a child process can be limited and killed. The header and the
// record sizes are checked here first so that only plausible files are handed over.
#include <algorithm>
#include <string>

#include "codecs/codec_internal.h"
#include "codecs/metafile_render.h"
#include "codecs/render_client.h"

namespace quillane::codecs {
namespace {

constexpr std::uint32_t kPlaceableKey = 0x9AC6CDD7;
constexpr std::size_t kPlaceableSize = 22;
constexpr std::size_t kStandardHeaderSize = 18;

std::uint16_t ReadWord(Bytes d, std::size_t at) {
  return static_cast<std::uint16_t>(d[at] | d[at + 1] << 8);
}
std::uint32_t ReadDword(Bytes d, std::size_t at) {
  return static_cast<std::uint32_t>(ReadWord(d, at)) |
         static_cast<std::uint32_t>(ReadWord(d, at + 2)) << 16;
}

// The standard header: type 1 (memory) or 2 (disk), a header of 9 words, and a version.
bool StandardHeaderAt(Bytes data, std::size_t at) {
  if (data.size() < at + kStandardHeaderSize) return false;
  const std::uint16_t type = ReadWord(data, at);
  return (type == 1 || type == 2) && ReadWord(data, at + 2) == 9 &&
         (ReadWord(data, at + 4) == 0x0100 || ReadWord(data, at + 4) == 0x0300);
}

// Walks the records so that a file whose record sizes run past its end is refused here
// rather than left to the player. Returns the size of the largest record in words.
std::uint32_t CheckRecords(Bytes data, std::size_t at) {
  at += kStandardHeaderSize;
  std::uint32_t largest = 0;
  while (true) {
    if (data.size() - at < 6) throw PictureFileError("The metafile ends inside a record");
    const std::uint64_t words = ReadDword(data, at);
    const std::uint16_t function = ReadWord(data, at + 4);
    if (words < 3 || words * 2 > data.size() - at) {
      throw PictureFileError("The metafile has a record of a bad size");
    }
    largest = std::max(largest, static_cast<std::uint32_t>(words));
    if (function == 0) return largest;  // META_EOF
    at += static_cast<std::size_t>(words * 2);
  }
}

}  // namespace

TBitmap32 DecodeWindowsMetafile(Bytes data, std::int64_t maxPixels) {
  std::size_t header = 0;
  if (data.size() >= 4 && ReadDword(data, 0) == kPlaceableKey) header = kPlaceableSize;
  if (!StandardHeaderAt(data, header)) {
    throw PictureFileError("The file is not a Windows metafile");
  }
  if (data.size() > 0x7FFFFFFF) throw PictureFileError("The metafile is too large");
  // The player sizes its record buffer from the header's largest-record field; a made-up
  // value there would have it allocate gigabytes (or too little). The true value is known
  // from the walk, so the player gets a copy of the file carrying it.
  const std::uint32_t largest = CheckRecords(data, header);
  std::vector<std::uint8_t> file(data.begin(), data.end());
  const std::size_t largestField = header + 12;
  for (int i = 0; i < 4; ++i) {
    file[largestField + static_cast<std::size_t>(i)] =
        static_cast<std::uint8_t>(largest >> (8 * i));
  }

  const std::string renderer = FindRenderer("QUILLANE_WMF_RENDER", metafile_render::kWmfProgramName,
                                            QUILLANE_WMF_RENDER_BUILT);
  if (renderer.empty()) throw PictureFileError("The metafile reader is not installed");
  // The renderer never makes a picture larger than the program could hold.
  const std::int64_t rendererMaxPixels =
      std::clamp<std::int64_t>(maxPixels, 0, TBitmap32::kMaxPixels);
  RendererAnswer answer =
      RunRenderer(renderer, {std::to_string(rendererMaxPixels), std::to_string(file.size())}, file,
                  rendererMaxPixels);
  using metafile_render::Reply;
  switch (answer.reply) {
    case Reply::kPicture:
      return std::move(answer.picture);
    case Reply::kSize:
      CheckPictureSize(answer.width, answer.height, rendererMaxPixels, "metafile");
      break;
    case Reply::kNotStarted:
      throw PictureFileError("The metafile reader could not start");
    case Reply::kNotOpened:
      throw PictureFileError("The metafile cannot be opened");
    case Reply::kDamaged:
      throw PictureFileError("The metafile is damaged");
    case Reply::kNoUnitsPerInch:
      throw PictureFileError("The metafile has no units per inch");
    case Reply::kNoPictureSize:
      throw PictureFileError("The metafile has no picture size");
    case Reply::kNotDrawn:
      break;
  }
  throw PictureFileError("The metafile cannot be drawn");
}

TBitmap32 DecodeMetafile(Bytes data, std::int64_t maxPixels) {
  if (data.empty()) throw PictureFileError("The metafile is empty");
  if (LooksLikeEnhancedMetafile(data)) return DecodeEnhancedMetafile(data, maxPixels);
  return DecodeWindowsMetafile(data, maxPixels);
}

}  // namespace quillane::codecs
