// Makes writes fail part way, as a full disk would: while an object lives, no file may grow
// beyond the given size, and the signal that would otherwise end the process is ignored, so
// the write reports EFBIG instead. Both are restored when it goes, however the test ends.
#pragma once

#include <signal.h>
#include <sys/resource.h>

#include <stdexcept>

namespace quillane {

class FileSizeLimit {
 public:
  explicit FileSizeLimit(rlim_t bytes) {
    struct sigaction ignore {};
    ignore.sa_handler = SIG_IGN;
    if (::sigaction(SIGXFSZ, &ignore, &previousAction_) != 0 ||
        ::getrlimit(RLIMIT_FSIZE, &previousLimit_) != 0)
      throw std::runtime_error("cannot limit the file size");
    rlimit small = previousLimit_;
    small.rlim_cur = bytes;
    if (::setrlimit(RLIMIT_FSIZE, &small) != 0) {
      ::sigaction(SIGXFSZ, &previousAction_, nullptr);
      throw std::runtime_error("cannot limit the file size");
    }
  }
  ~FileSizeLimit() {
    ::setrlimit(RLIMIT_FSIZE, &previousLimit_);
    ::sigaction(SIGXFSZ, &previousAction_, nullptr);
  }
  FileSizeLimit(const FileSizeLimit&) = delete;
  FileSizeLimit& operator=(const FileSizeLimit&) = delete;

 private:
  struct sigaction previousAction_ {};
  rlimit previousLimit_{};
};

}  // namespace quillane
