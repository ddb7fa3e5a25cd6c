// A file written beside its target and moved over it only once complete.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"

namespace quillane::codecs {

// Creates a temporary file in the target's folder. Write buffers and reports any error as
// PictureFileError giving the reason (the caller names the file); Commit flushes, syncs and renames
// the temporary file over the target. A file that was never committed is removed by the destructor,
// so the target is either the old file or the complete new one.
class AtomicFile : public ByteSink {
 public:
  explicit AtomicFile(std::string target);
  ~AtomicFile() override;
  AtomicFile(const AtomicFile&) = delete;
  AtomicFile& operator=(const AtomicFile&) = delete;

  void Write(const void* data, std::size_t size) override;
  void Commit();

 private:
  void Flush();
  [[noreturn]] void Fail(int error);

  std::string target_;
  std::string temp_;
  int fd_ = -1;
  bool committed_ = false;
  std::vector<char> buffer_;
};

}  // namespace quillane::codecs
