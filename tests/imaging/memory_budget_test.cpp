// The control-group memory limits the budget finds, read from fake /proc and /sys trees laid
// out as cgroup v1 (this kind of machine), v2 with nested groups (systemd units and user
// sessions) and a container's namespace show them.
#include "imaging/memory_budget.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <limits>
#include <map>
#include <string>

namespace quillane {
namespace {

namespace fs = std::filesystem;

constexpr std::int64_t kMiB = std::int64_t{1} << 20;
constexpr std::int64_t kNone = std::numeric_limits<std::int64_t>::max();
const std::string kV1NoLimit = "9223372036854771712";

const std::string kV1Mounts =
    "31 23 0:28 / /sys/fs/cgroup rw,relatime - tmpfs tmpfs rw,mode=755\n"
    "32 31 0:29 / /sys/fs/cgroup/cpu rw,relatime - cgroup cgroup rw,cpu\n"
    "35 31 0:32 / /sys/fs/cgroup/memory rw,relatime - cgroup cgroup rw,memory\n"
    "41 31 0:38 / /sys/fs/cgroup/unified rw,relatime - cgroup2 cgroup2 rw\n";
const std::string kV2Mounts =
    "30 23 0:26 / /sys/fs/cgroup rw,nosuid shared:4 - cgroup2 cgroup2 rw,nsdelegate\n";

class ControlGroupTree : public ::testing::Test {
 protected:
  void SetUp() override {
    std::string pattern = (fs::temp_directory_path() / "quillane-cgroup-XXXXXX").string();
    ASSERT_NE(mkdtemp(pattern.data()), nullptr);
    root_ = pattern;
  }
  void TearDown() override { fs::remove_all(root_); }
  // Writes each path (below the fake root) with its text.
  void Lay(const std::map<std::string, std::string>& files) {
    for (const auto& [path, text] : files) {
      fs::create_directories(fs::path(root_ + path).parent_path());
      std::ofstream(root_ + path) << text;
    }
  }
  std::string root_;
};

TEST_F(ControlGroupTree, TightestLimitUpTheHierarchyLessWhatCannotBeDropped) {
  const std::string v1 = "/sys/fs/cgroup/memory";
  const std::string v2 = "/sys/fs/cgroup";
  const struct {
    const char* what;
    std::map<std::string, std::string> files;
    std::int64_t left;
  } cases[] = {
      {"v1: the limit is on the parent; its dropped-able cache is not in use",
       {{"/proc/self/cgroup", "9:name=systemd:/\n4:memory:/jobs/42\n1:cpu:/\n0::/\n"},
        {"/proc/self/mountinfo", kV1Mounts},
        {v1 + "/jobs/42/memory.limit_in_bytes", kV1NoLimit},
        {v1 + "/jobs/42/memory.usage_in_bytes", "1000"},
        {v1 + "/jobs/memory.limit_in_bytes", std::to_string(1024 * kMiB)},
        {v1 + "/jobs/memory.usage_in_bytes", std::to_string(300 * kMiB)},
        {v1 + "/jobs/memory.stat", "cache 5\ntotal_inactive_file " + std::to_string(100 * kMiB)},
        {v1 + "/memory.limit_in_bytes", kV1NoLimit}},
       824 * kMiB},
      {"v2: a session inside a slice, the session the tighter",
       {{"/proc/self/cgroup", "0::/user.slice/session-3.scope\n"},
        {"/proc/self/mountinfo", kV2Mounts},
        {v2 + "/user.slice/memory.max", std::to_string(2048 * kMiB)},
        {v2 + "/user.slice/memory.current", std::to_string(1536 * kMiB)},
        {v2 + "/user.slice/memory.stat", "anon 1\ninactive_file " + std::to_string(512 * kMiB)},
        {v2 + "/user.slice/session-3.scope/memory.max", std::to_string(3000 * kMiB)},
        {v2 + "/user.slice/session-3.scope/memory.current", std::to_string(2900 * kMiB)}},
       100 * kMiB},
      {"v2: the slice the tighter, the session unlimited",
       {{"/proc/self/cgroup", "0::/user.slice/session-3.scope\n"},
        {"/proc/self/mountinfo", kV2Mounts},
        {v2 + "/user.slice/memory.max", std::to_string(2048 * kMiB)},
        {v2 + "/user.slice/memory.current", std::to_string(48 * kMiB)},
        {v2 + "/user.slice/session-3.scope/memory.max", "max"},
        {v2 + "/user.slice/session-3.scope/memory.current", "5"}},
       2000 * kMiB},
      {"v2 in a container: the mount's top is the container's own group",
       {{"/proc/self/cgroup", "0::/docker/abc\n"},
        {"/proc/self/mountinfo", "30 23 0:26 /docker/abc /sys/fs/cgroup ro - cgroup2 cgroup2 rw\n"},
        {v2 + "/memory.max", std::to_string(512 * kMiB)},
        {v2 + "/memory.current", std::to_string(12 * kMiB)}},
       500 * kMiB},
      {"v1 and v2 both present: the smaller",
       {{"/proc/self/cgroup", "4:memory:/a\n0::/b\n"},
        {"/proc/self/mountinfo", kV1Mounts},
        {v1 + "/a/memory.limit_in_bytes", std::to_string(900 * kMiB)},
        {v1 + "/a/memory.usage_in_bytes", "0"},
        {"/sys/fs/cgroup/unified/b/memory.max", std::to_string(300 * kMiB)},
        {"/sys/fs/cgroup/unified/b/memory.current", "0"}},
       300 * kMiB},
      {"no limit anywhere",
       {{"/proc/self/cgroup", "0::/user.slice\n"},
        {"/proc/self/mountinfo", kV2Mounts},
        {v2 + "/user.slice/memory.max", "max"}},
       kNone},
      {"used beyond the limit: nothing left",
       {{"/proc/self/cgroup", "4:memory:/x\n"},
        {"/proc/self/mountinfo", kV1Mounts},
        {v1 + "/x/memory.limit_in_bytes", std::to_string(10 * kMiB)},
        {v1 + "/x/memory.usage_in_bytes", std::to_string(11 * kMiB)}},
       0},
      {"nothing to read", {}, kNone},
  };
  for (const auto& c : cases) {
    fs::remove_all(root_);
    fs::create_directories(root_);
    Lay(c.files);
    EXPECT_EQ(ControlGroupMemoryLeft(root_), c.left) << c.what;
  }
}

}  // namespace
}  // namespace quillane
