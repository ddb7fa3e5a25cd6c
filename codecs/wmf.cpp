// Windows metafiles through libwmf, played by its gd device in quillane-wmf-render, a process of
// its own: a hostile file can keep libwmf drawing for minutes inside a single record, or have it
// allocate without bound, and only a child process can be limited and killed. The header and the
// record sizes are checked here first so that only plausible files are handed over.
#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <string>

#include "codecs/codec_internal.h"
#include "codecs/helper_process.h"
#include "codecs/wmf_render.h"

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

// The renderer's own folder first (an installed program), then the one it was built in.
std::string FindRenderer() {
  if (const char* chosen = std::getenv("QUILLANE_WMF_RENDER"); chosen != nullptr && *chosen) {
    return ::access(chosen, X_OK) == 0 ? chosen : "";
  }
  std::error_code error;
  const std::filesystem::path self = std::filesystem::read_symlink("/proc/self/exe", error);
  if (!error) {
    const std::string beside = (self.parent_path() / wmf_render::kProgramName).string();
    if (::access(beside.c_str(), X_OK) == 0) return beside;
  }
#ifdef QUILLANE_WMF_RENDER_BUILT
  if (::access(QUILLANE_WMF_RENDER_BUILT, X_OK) == 0) return QUILLANE_WMF_RENDER_BUILT;
#endif
  return {};
}

// Takes the renderer's reply apart as it arrives; the pixels go straight into the picture,
// which is only allocated once its size has been checked.
class RenderReply : public HelperOutput {
 public:
  explicit RenderReply(std::int64_t maxPixels) : maxPixels_(maxPixels) {}

  std::span<std::uint8_t> Space() override {
    if (headerGot_ < wmf_render::kReplyHeaderSize) {
      return {header_ + headerGot_, wmf_render::kReplyHeaderSize - headerGot_};
    }
    if (reply_ != wmf_render::Reply::kPicture) return {};
    auto* pixels = reinterpret_cast<std::uint8_t*>(picture_.Data());
    return {pixels + pixelsGot_, PixelBytes() - pixelsGot_};
  }
  void Received(std::size_t count) override {
    if (headerGot_ < wmf_render::kReplyHeaderSize) {
      headerGot_ += count;
      if (headerGot_ == wmf_render::kReplyHeaderSize) TakeHeader();
    } else {
      pixelsGot_ += count;
    }
  }

  bool Complete() const {
    return headerGot_ == wmf_render::kReplyHeaderSize &&
           (reply_ != wmf_render::Reply::kPicture || pixelsGot_ == PixelBytes());
  }
  wmf_render::Reply reply() const { return reply_; }
  std::uint32_t width() const { return width_; }
  std::uint32_t height() const { return height_; }
  TBitmap32 TakePicture() { return std::move(picture_); }

 private:
  std::size_t PixelBytes() const { return picture_.PixelCount() * sizeof(Pixel); }
  void TakeHeader() {
    std::uint32_t words[3];
    std::memcpy(words, header_, sizeof words);
    reply_ = static_cast<wmf_render::Reply>(words[0]);
    width_ = words[1];
    height_ = words[2];
    if (reply_ != wmf_render::Reply::kPicture) return;
    // At most TBitmap32::kMaxPixels, so each side fits an int.
    CheckPictureSize(width_, height_, maxPixels_, "metafile");
    picture_ = TBitmap32(static_cast<int>(width_), static_cast<int>(height_));
  }

  std::int64_t maxPixels_;
  std::uint8_t header_[wmf_render::kReplyHeaderSize] = {};
  std::size_t headerGot_ = 0;
  wmf_render::Reply reply_{};
  std::uint32_t width_ = 0, height_ = 0;
  TBitmap32 picture_;
  std::size_t pixelsGot_ = 0;
};

[[noreturn]] void ThrowForIncompleteReply(const HelperEnding& ending) {
  using Kind = HelperEnding::Kind;
  if (ending.kind == Kind::kNotStarted) {
    if (ending.value == ENOENT || ending.value == EACCES || ending.value == ENOEXEC) {
      throw PictureFileError("The metafile reader is not installed");
    }
    throw PictureFileError("The metafile reader could not start");
  }
  // The renderer's CPU limit ends it with SIGXCPU, then SIGKILL.
  if (ending.kind == Kind::kTimedOut ||
      (ending.kind == Kind::kSignalled && (ending.value == SIGXCPU || ending.value == SIGKILL))) {
    throw PictureFileError("The metafile takes too long to draw");
  }
  throw PictureFileError("The metafile cannot be drawn");
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

  const std::string renderer = FindRenderer();
  if (renderer.empty()) throw PictureFileError("The metafile reader is not installed");
  // The renderer never makes a picture larger than the program could hold.
  const std::int64_t rendererMaxPixels =
      std::clamp<std::int64_t>(maxPixels, 0, TBitmap32::kMaxPixels);
  RenderReply reply(rendererMaxPixels);
  const HelperEnding ending =
      RunHelper(renderer, {std::to_string(rendererMaxPixels), std::to_string(file.size())}, file,
                std::chrono::seconds(wmf_render::WallClockSeconds(rendererMaxPixels)), reply);
  if (!reply.Complete()) ThrowForIncompleteReply(ending);
  using wmf_render::Reply;
  switch (reply.reply()) {
    case Reply::kPicture:
      return reply.TakePicture();
    case Reply::kSize:
      CheckPictureSize(reply.width(), reply.height(), rendererMaxPixels, "metafile");
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
