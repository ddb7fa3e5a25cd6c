// A file written out of sight and put in place of its target only once complete.
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"

namespace quillane::codecs {

// Writes the new content of target, which is either the old file or the complete new one,
// whatever happens meanwhile:
// - a symbolic link is followed, and the file it names is the one replaced (the link stays);
//   with LinkAtTarget::Refuse it is refused instead ("it is a symbolic link"), and a link put
//   there while the file is written is replaced, never followed;
// - a target without write permission is refused ("the file is read-only");
// - the new file takes the old one's permission bits (where the file system has them) and,
//   where allowed, its owner (run by root) and group;
// - the content goes into an unnamed file in the target's folder (O_TMPFILE), given a name only
//   when complete, so an interrupted save (a signal, a crash) leaves nothing behind. On file
//   systems without unnamed files a hidden, randomly named one is used and removed on failure.
// Write buffers and reports any error as PictureFileError giving the reason (the caller names
// the file); Commit flushes, syncs and moves the file into place.
class AtomicFile : public ByteSink {
 public:
  explicit AtomicFile(std::string target, LinkAtTarget links = LinkAtTarget::Follow);
  ~AtomicFile() override;
  AtomicFile(const AtomicFile&) = delete;
  AtomicFile& operator=(const AtomicFile&) = delete;

  void Write(const void* data, std::size_t size) override;
  void Commit();

 private:
  void Flush();
  [[noreturn]] void Fail(int error);
  std::string HiddenName() const;

  std::string target_;  // the file itself, links followed
  std::string temp_;    // the named temporary file, when there is one
  int fd_ = -1;
  bool unnamed_ = false;
  bool committed_ = false;
  bool replacing_ = false;  // a file exists at target_; its mode, owner and group are kept
  mode_t mode_ = 0;
  uid_t owner_ = 0;
  gid_t group_ = 0;
  std::vector<char> buffer_;
};

}  // namespace quillane::codecs
