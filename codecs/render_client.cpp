#include "codecs/render_client.h"

#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "codecs/helper_process.h"

namespace quillane::codecs {
namespace {

using metafile_render::kReplyHeaderSize;
using metafile_render::Reply;

// Takes the renderer's reply apart as it arrives; the pixels go straight into the picture,
// which is only allocated once its size has been checked.
class RenderReply : public HelperOutput {
 public:
  explicit RenderReply(std::int64_t maxPixels) : maxPixels_(maxPixels) {}

  std::span<std::uint8_t> Space() override {
    if (headerGot_ < kReplyHeaderSize) {
      return {header_ + headerGot_, kReplyHeaderSize - headerGot_};
    }
    if (answer_.reply != Reply::kPicture) return {};
    auto* pixels = reinterpret_cast<std::uint8_t*>(answer_.picture.Data());
    return {pixels + pixelsGot_, PixelBytes() - pixelsGot_};
  }
  void Received(std::size_t count) override {
    if (headerGot_ < kReplyHeaderSize) {
      headerGot_ += count;
      if (headerGot_ == kReplyHeaderSize) TakeHeader();
    } else {
      pixelsGot_ += count;
    }
  }

  bool Complete() const {
    return headerGot_ == kReplyHeaderSize &&
           (answer_.reply != Reply::kPicture || pixelsGot_ == PixelBytes());
  }
  RendererAnswer Take() { return std::move(answer_); }

 private:
  std::size_t PixelBytes() const { return answer_.picture.PixelCount() * sizeof(Pixel); }
  void TakeHeader() {
    std::uint32_t words[3];
    std::memcpy(words, header_, sizeof words);
    answer_.reply = static_cast<Reply>(words[0]);
    answer_.width = words[1];
    answer_.height = words[2];
    if (answer_.reply != Reply::kPicture) return;
    // At most Bitmap32::kMaxPixels, so each side fits an int.
    CheckPictureSize(answer_.width, answer_.height, maxPixels_, "metafile");
    answer_.picture = Bitmap32(static_cast<int>(answer_.width), static_cast<int>(answer_.height));
  }

  std::int64_t maxPixels_;
  std::uint8_t header_[kReplyHeaderSize] = {};
  std::size_t headerGot_ = 0;
  RendererAnswer answer_;
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

std::string FindRenderer(const char* environmentVariable, const char* programName,
                         const char* builtPath) {
  if (const char* chosen = std::getenv(environmentVariable); chosen != nullptr && *chosen) {
    return ::access(chosen, X_OK) == 0 ? chosen : "";
  }
  std::error_code error;
  const std::filesystem::path self = std::filesystem::read_symlink("/proc/self/exe", error);
  if (!error) {
    const std::string beside = (self.parent_path() / programName).string();
    if (::access(beside.c_str(), X_OK) == 0) return beside;
  }
  // The build tree's copy serves only the programs and tests that run from the build tree: an
  // installed program never reaches back into the folder it was built in.
  const std::string buildTree = QUILLANE_BUILD_TREE "/";
  const bool inBuildTree = error || self.string().compare(0, buildTree.size(), buildTree) == 0;
  if (inBuildTree && builtPath != nullptr && ::access(builtPath, X_OK) == 0) return builtPath;
  return {};
}

RendererAnswer RunRenderer(const std::string& program, const std::vector<std::string>& arguments,
                           Bytes file, std::int64_t maxPixels) {
  RenderReply reply(maxPixels);
  const auto timeout = std::chrono::seconds(metafile_render::WallClockSeconds(
      static_cast<std::uint64_t>(std::max<std::int64_t>(maxPixels, 0))));
  const HelperEnding ending = RunHelper(program, arguments, file, timeout, reply);
  if (!reply.Complete()) ThrowForIncompleteReply(ending);
  return reply.Take();
}

}  // namespace quillane::codecs
