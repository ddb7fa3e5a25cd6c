// How much memory a picture operation may still take, so that a picture too large for this
// machine (or for the limit this process runs under) is refused with a sentence before any of
// it is allocated, rather than ending the program half way.
#pragma once

#include <cstdint>
#include <new>
#include <string>

namespace quillane {

// Copies of a full-size 32-bit picture that opening a picture and running an effect on it hold
// at once: the decoded picture (shared by the document's pictures and its history), the
// effect's result and the effect's scratch pictures.
inline constexpr int kPictureCopiesPerOperation = 4;

// Thrown when a picture would not fit. what() is a sentence for the user, ending in
// "needs 1.9 GB; 1.1 GB are available".
class NotEnoughMemory : public std::bad_alloc {
 public:
  explicit NotEnoughMemory(std::string text) : text_(std::move(text)) {}
  const char* what() const noexcept override { return text_.c_str(); }

 private:
  std::string text_;
};

// Bytes this process can still allocate: the smaller of what its address-space limit leaves,
// what its control group's limit leaves and what the system reports available.
std::int64_t AvailableMemory();

// Bytes the control groups of this process still let it take: for the memory controller of
// cgroup v1 and for cgroup v2, at every level from the process's own group up to the top of the
// mounted hierarchy, the tightest of limit less usage, where file cache the kernel can drop
// does not count as used. The groups come from /proc/self/cgroup, their folders from the
// cgroup mounts in /proc/self/mountinfo. root is put before every path read (a fake tree for
// tests). INT64_MAX when no group sets a limit.
std::int64_t ControlGroupMemoryLeft(const std::string& root = "");

// bytes written for people: "512 KB", "38 MB", "1.9 GB".
std::string MemoryAmount(std::int64_t bytes);

// "needs 1.9 GB; 1.1 GB are available", with the bytes available now.
std::string MemoryNeedText(std::int64_t neededBytes);

// The bytes an operation on a width by height picture needs: the copies above at four bytes a
// pixel, plus extraBytesPerPixel for a decoder's own buffers.
std::int64_t OperationBytes(std::int64_t width, std::int64_t height, int extraBytesPerPixel = 0);

// Throws NotEnoughMemory("<what> of W by H pixels needs ...") when OperationBytes does not fit
// in AvailableMemory.
void CheckMemoryFor(std::int64_t width, std::int64_t height, const std::string& what,
                    int extraBytesPerPixel = 0);

}  // namespace quillane
