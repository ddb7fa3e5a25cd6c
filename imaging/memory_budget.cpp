#include "imaging/memory_budget.h"

#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <limits>
#include <optional>
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

// The first number in a file; kUnknown when there is none ("max" in memory.max).
std::int64_t NumberIn(const std::string& path) {
  std::ifstream file(path);
  std::int64_t value = 0;
  return file >> value ? value : kUnknown;
}

// The value of key in a "key value" file such as memory.stat; 0 when missing.
std::int64_t StatValue(const std::string& path, const std::string& key) {
  std::ifstream file(path);
  std::string name;
  std::int64_t value = 0;
  while (file >> name >> value)
    if (name == key) return value;
  return 0;
}

// A mounted cgroup hierarchy: where it is, and which group its top folder is.
struct CgroupMount {
  std::string point;
  std::string groupAtPoint;
};

// The mount of the v2 hierarchy (memoryV1 false) or of v1's memory controller, from mountinfo
// lines "id parent dev root point options ... - type source super-options".
std::optional<CgroupMount> FindCgroupMount(const std::string& root, bool memoryV1) {
  std::ifstream mountinfo(root + "/proc/self/mountinfo");
  std::string line;
  while (std::getline(mountinfo, line)) {
    std::istringstream fields(line);
    std::string id, parent, device, groupAtPoint, point, field;
    if (!(fields >> id >> parent >> device >> groupAtPoint >> point)) continue;
    while (fields >> field && field != "-") {
    }
    std::string type, source, options;
    if (!(fields >> type >> source >> options)) continue;
    const bool memory = ("," + options + ",").find(",memory,") != std::string::npos;
    if (memoryV1 ? type == "cgroup" && memory : type == "cgroup2")
      return CgroupMount{point, groupAtPoint};
  }
  return std::nullopt;
}

// limit less usage (less file cache that can be dropped) of each level from folder up to top.
std::int64_t LeftUpTo(const std::string& top, std::string folder, bool memoryV1) {
  std::int64_t left = kUnknown;
  while (true) {
    const std::int64_t limit =
        NumberIn(folder + (memoryV1 ? "/memory.limit_in_bytes" : "/memory.max"));
    // v1 writes "no limit" as the largest multiple of the page size below 2^63.
    if (limit != kUnknown && limit < (std::int64_t{1} << 62)) {
      const std::int64_t usage =
          NumberIn(folder + (memoryV1 ? "/memory.usage_in_bytes" : "/memory.current"));
      const std::int64_t cache =
          StatValue(folder + "/memory.stat", memoryV1 ? "total_inactive_file" : "inactive_file");
      const std::int64_t used = usage == kUnknown ? 0 : std::max<std::int64_t>(0, usage - cache);
      left = std::min(left, std::max<std::int64_t>(0, limit - used));
    }
    if (folder.size() <= top.size()) return left;
    folder.resize(folder.rfind('/'));
  }
}

}  // namespace

std::int64_t ControlGroupMemoryLeft(const std::string& root) {
  // Lines "hierarchy:controllers:path"; v2 is the one with hierarchy 0 and no controllers.
  std::ifstream groups(root + "/proc/self/cgroup");
  std::string line;
  std::int64_t left = kUnknown;
  while (std::getline(groups, line)) {
    const std::size_t first = line.find(':');
    const std::size_t second = first == std::string::npos ? first : line.find(':', first + 1);
    if (second == std::string::npos) continue;
    const std::string controllers = line.substr(first + 1, second - first - 1);
    const bool memoryV1 = ("," + controllers + ",").find(",memory,") != std::string::npos;
    if (!memoryV1 && !(line.compare(0, first, "0") == 0 && controllers.empty())) continue;
    const std::optional<CgroupMount> mount = FindCgroupMount(root, memoryV1);
    if (!mount) continue;
    std::string group = line.substr(second + 1);
    // Within a namespace or a container, the mount shows the group at its top; below it, the
    // process's group is the rest of the path.
    const std::string& atPoint = mount->groupAtPoint;
    if (atPoint != "/" && group.compare(0, atPoint.size(), atPoint) == 0 &&
        (group.size() == atPoint.size() || group[atPoint.size()] == '/')) {
      group = group.substr(atPoint.size());
    } else if (atPoint != "/") {
      group.clear();  // not under this mount's top: only what the mount shows applies
    }
    while (!group.empty() && group.back() == '/') group.pop_back();
    if (group.find("/..") != std::string::npos) continue;
    const std::string top = root + mount->point;
    left = std::min(left, LeftUpTo(top, top + group, memoryV1));
  }
  return left;
}

std::int64_t AvailableMemory() {
  return std::min({AddressSpaceLeft(), ControlGroupMemoryLeft(), MemInfoBytes("MemAvailable:")});
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
