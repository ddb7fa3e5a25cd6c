// Child processes for the decoders: input and output in full, killing, reaping, refusals.
#include "codecs/helper_process.h"

#include <signal.h>
#include <sys/wait.h>

#include <cerrno>
#include <filesystem>

#include "tests/codecs/test_support.h"

namespace quillane::testing {
namespace {

using codecs::HelperEnding;
using codecs::RunHelper;
using namespace std::chrono_literals;

class Collect : public codecs::HelperOutput {
 public:
  explicit Collect(std::size_t expected) : bytes(expected) {}
  std::span<std::uint8_t> Space() override { return std::span<std::uint8_t>(bytes).subspan(got); }
  void Received(std::size_t count) override { got += count; }
  std::vector<std::uint8_t> bytes;
  std::size_t got = 0;
};

// No child of this process is left running or unreaped.
void ExpectNoChildren() {
  errno = 0;
  EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1);
  EXPECT_EQ(errno, ECHILD);
}

std::size_t OpenDescriptors() {
  return static_cast<std::size_t>(std::distance(
      std::filesystem::directory_iterator("/proc/self/fd"), std::filesystem::directory_iterator()));
}

TEST(HelperProcess, PassesMegabytesThroughBothWays) {
  // More than either pipe holds, so input and output must be interleaved.
  const std::size_t descriptors = OpenDescriptors();
  std::vector<std::uint8_t> input(4 << 20);
  for (std::size_t i = 0; i < input.size(); ++i)
    input[i] = static_cast<std::uint8_t>(i * 7 + i / 251);
  Collect output(input.size());
  const HelperEnding ending = RunHelper("/bin/cat", {}, input, 30s, output);
  EXPECT_EQ(ending.kind, HelperEnding::Kind::kExited);
  EXPECT_EQ(ending.value, 0);
  EXPECT_EQ(output.got, input.size());
  EXPECT_TRUE(output.bytes == input);
  ExpectNoChildren();
  EXPECT_EQ(OpenDescriptors(), descriptors);
}

TEST(HelperProcess, KillsAndReapsChildrenThatMisbehave) {
  const std::size_t descriptors = OpenDescriptors();
  {
    Collect output(0);
    EXPECT_EQ(RunHelper("/bin/sleep", {"60"}, {}, 200ms, output).kind,
              HelperEnding::Kind::kTimedOut);
  }
  {
    // Sends more than the 10 bytes expected.
    Collect output(10);
    EXPECT_EQ(RunHelper("/bin/yes", {}, {}, 30s, output).kind, HelperEnding::Kind::kOverran);
    EXPECT_EQ(output.got, 10u);
  }
  {
    Collect output(0);
    const HelperEnding ending = RunHelper("/bin/sh", {"-c", "kill -SEGV $$"}, {}, 30s, output);
    EXPECT_EQ(ending.kind, HelperEnding::Kind::kSignalled);
    EXPECT_EQ(ending.value, SIGSEGV);
  }
  {
    // Ends without reading its input: the write fails quietly instead of raising SIGPIPE.
    Collect output(0);
    const std::vector<std::uint8_t> input(1 << 20, 'x');
    const HelperEnding ending = RunHelper("/bin/sh", {"-c", "exit 3"}, input, 30s, output);
    EXPECT_EQ(ending.kind, HelperEnding::Kind::kExited);
    EXPECT_EQ(ending.value, 3);
  }
  {
    Collect output(0);
    const HelperEnding ending = RunHelper("/nonexistent/helper", {}, {}, 30s, output);
    EXPECT_EQ(ending.kind, HelperEnding::Kind::kNotStarted);
    EXPECT_EQ(ending.value, ENOENT);
  }
  ExpectNoChildren();
  EXPECT_EQ(OpenDescriptors(), descriptors);
}

}  // namespace
}  // namespace quillane::testing
