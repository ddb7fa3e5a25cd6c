// Runs a helper program in a child process for work that must not be able to hang or exhaust
// the program itself: the input goes to the child's standard input, its standard output is
// handed over as it arrives, and a child that outlives its time is killed. Safe to call from any
// thread: the child is started with posix_spawn, never by forking the caller.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "codecs/codec_internal.h"

namespace quillane::codecs {

// Receives the child's standard output.
class HelperOutput {
 public:
  virtual ~HelperOutput() = default;
  // Where the next bytes go. Empty once nothing more is expected: a child that sends more is
  // killed. May throw; the child is then killed and reaped before the exception leaves.
  virtual std::span<std::uint8_t> Space() = 0;
  // count bytes have been stored at the start of the last Space().
  virtual void Received(std::size_t count) = 0;
};

struct HelperEnding {
  enum class Kind {
    kExited,      // value is the exit code, or -1 when it could not be collected
    kSignalled,   // value is the signal that ended it
    kTimedOut,    // killed when its time was up
    kOverran,     // killed for sending more than was expected
    kNotStarted,  // value is the errno of what failed (ENOENT when the program is missing)
  };
  Kind kind;
  int value = 0;
};

// Runs program with the given arguments, writes input to its standard input (then closes it),
// passes its standard output to output, and waits until the child has ended and been reaped or
// until timeout has passed, when the child is killed. The child's standard error goes to
// /dev/null (libraries chatter there on hostile input, and the child may not be allowed to write
// files); it starts with no blocked signals and default dispositions for the signals that matter
// to it, and with this process's id in its environment (helper_parent.h) so that it can arrange
// to die with us.
HelperEnding RunHelper(const std::string& program, const std::vector<std::string>& arguments,
                       Bytes input, std::chrono::milliseconds timeout, HelperOutput& output);

}  // namespace quillane::codecs
