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

TEST(HelperProcess, PassesDataAndKillsAndReapsChildrenThatMisbehave) {
  const std::size_t descriptors = OpenDescriptors();
  using Kind = HelperEnding::Kind;
  const struct {
    const char* program;
    std::vector<std::string> args;
    std::size_t input, expected;
    std::chrono::milliseconds timeout;
    Kind kind;
    int value;  // -1: any
  } cases[] = {
      // More than either pipe holds, so input and output must be interleaved.
      {"/bin/cat", {}, 4 << 20, 4 << 20, 30s, Kind::kExited, 0},
      {"/bin/sleep", {"60"}, 0, 0, 200ms, Kind::kTimedOut, -1},
      // Sends more than the 10 bytes expected.
      {"/bin/yes", {}, 0, 10, 30s, Kind::kOverran, -1},
      {"/bin/sh", {"-c", "kill -SEGV $$"}, 0, 0, 30s, Kind::kSignalled, SIGSEGV},
      // Ends without reading its input: the write fails quietly instead of raising SIGPIPE.
      {"/bin/sh", {"-c", "exit 3"}, 1 << 20, 0, 30s, Kind::kExited, 3},
      {"/nonexistent/helper", {}, 0, 0, 30s, Kind::kNotStarted, ENOENT}};
  for (const auto& c : cases) {
    Collect output(c.expected);
    std::vector<std::uint8_t> input(c.input);
    for (std::size_t i = 0; i < input.size(); ++i)
      input[i] = static_cast<std::uint8_t>(i * 7 + i / 251);
    const HelperEnding ending = RunHelper(c.program, c.args, input, c.timeout, output);
    EXPECT_EQ(ending.kind, c.kind) << c.program;
    EXPECT_TRUE(c.value < 0 || ending.value == c.value) << c.program << ": " << ending.value;
    EXPECT_EQ(output.got, c.expected) << c.program;
    EXPECT_TRUE(c.input != c.expected || output.bytes == input) << c.program;
  }
  ExpectNoChildren();
  EXPECT_EQ(OpenDescriptors(), descriptors);
}

}  // namespace
}  // namespace quillane::testing
