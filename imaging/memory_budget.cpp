#include "imaging/memory_budget.h"

#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <limits>
#include <sstream>

#include "imaging/picture_memory.h"

namespace quillane {
namespace {

constexpr std::int64_t kUnknown = std::numeric_limits<std::int64_t>::max();

// The first number after key in a "key: value kB" file such as /proc/meminfo, in bytes.
std::int64_t MemInfoBytes(const char* key) {
  std::ifstream file("/proc/meminfo");
  std::string name;
  std::int64_t kilobytes = 0;
  std::string unit;
  while (file >> name >> kilobytes) {
    std::getline(file, unit);
    if (name == key) return kilobytes * 1024;
  }
  return kUnknown;
}

std::int64_t AddressSpaceLeft() {
  rlimit limit{};
  if (::getrlimit(RLIMIT_AS, &limit) != 0 || limit.rlim_cur == RLIM_INFINITY) return kUnknown;
  std::ifstream statm("/proc/self/statm");
  std::int64_t pages = 0;
  if (!(statm >> pages)) return kUnknown;
  const std::int64_t used = pages * ::sysconf(_SC_PAGESIZE);
  return std::max<std::int64_t>(0, static_cast<std::int64_t>(limit.rlim_cur) - used);
}

std::int64_t ControlGroupLeft() {
  std::ifstream maxFile("/sys/fs/cgroup/memory.max");
  std::ifstream currentFile("/sys/fs/cgroup/memory.current");
  std::int64_t max = 0, current = 0;
  // "max" (no limit) does not read as a number.
  if (!(maxFile >> max) || !(currentFile >> current)) return kUnknown;
  return std::max<std::int64_t>(0, max - current);
}

}  // namespace

std::int64_t AvailableMemory() {
  return std::min({AddressSpaceLeft(), ControlGroupLeft(), MemInfoBytes("MemAvailable:")});
}

std::string MemoryAmount(std::int64_t bytes) {
  char text[32];
  const double kb = static_cast<double>(bytes) / 1024;
  if (kb < 1024) {
    std::snprintf(text, sizeof text, "%.0f KB", kb);
  } else if (kb < 1024 * 1024) {
    std::snprintf(text, sizeof text, "%.0f MB", kb / 1024);
  } else {
    std::snprintf(text, sizeof text, "%.1f GB", kb / (1024 * 1024));
  }
  return text;
}

std::string MemoryNeedText(std::int64_t neededBytes) {
  const std::int64_t available = AvailableMemory();
  return "needs " + MemoryAmount(neededBytes) + "; " +
         (available == kUnknown ? std::string("less") : MemoryAmount(available)) + " are available";
}

std::int64_t OperationBytes(std::int64_t width, std::int64_t height, int extraBytesPerPixel) {
  // Sides beyond 2^31 are refused elsewhere; here they must only not overflow.
  constexpr std::int64_t kSide = std::int64_t{1} << 31;
  const std::int64_t pixels =
      std::clamp<std::int64_t>(width, 0, kSide) * std::clamp<std::int64_t>(height, 0, kSide) / 1;
  if (pixels > (std::int64_t{1} << 56)) return kUnknown;
  return pixels * (4 * kPictureCopiesPerOperation + extraBytesPerPixel);
}

void CheckMemoryFor(std::int64_t width, std::int64_t height, const std::string& what,
                    int extraBytesPerPixel) {
  const std::int64_t needed = OperationBytes(width, height, extraBytesPerPixel);
  if (needed <= AvailableMemory()) return;
  // Memory kept for reuse counts as taken; give it back before refusing.
  ReleasePictureMemory();
  if (needed <= AvailableMemory()) return;
  throw NotEnoughMemory(what + " of " + std::to_string(width) + " by " + std::to_string(height) +
                        " pixels " + MemoryNeedText(needed));
}

}  // namespace quillane
