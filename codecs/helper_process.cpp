#include "codecs/helper_process.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "codecs/helper_parent.h"

extern char** environ;

namespace quillane::codecs {
namespace {

using Clock = std::chrono::steady_clock;

class Fd {
 public:
  Fd() = default;
  explicit Fd(int fd) : fd_(fd) {}
  ~Fd() { Close(); }
  Fd(const Fd&) = delete;
  Fd& operator=(const Fd&) = delete;

  int get() const { return fd_; }
  bool open() const { return fd_ >= 0; }
  void Close() {
    if (fd_ >= 0) ::close(fd_);
    fd_ = -1;
  }
  // Keeps the descriptor clear of 0, 1 and 2: dup2 onto the child's standard descriptors must
  // make a new, inheritable copy rather than find the descriptor already in place (and still
  // marked close-on-exec).
  bool MoveAboveStandard() {
    if (fd_ > STDERR_FILENO) return true;
    const int moved = ::fcntl(fd_, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    Close();
    fd_ = moved;
    return moved >= 0;
  }

 private:
  int fd_ = -1;
};

// Kills and reaps the child unless it has been reaped already, so that no exit leaves a
// zombie or a running child behind.
class Child {
 public:
  explicit Child(pid_t pid) : pid_(pid) {}
  ~Child() {
    if (!reaped_) Kill();
  }
  Child(const Child&) = delete;
  Child& operator=(const Child&) = delete;

  void Kill() {
    if (reaped_) return;  // the id may belong to someone else by now
    ::kill(pid_, SIGKILL);
    Wait(0);
  }
  // True once the child has ended and been reaped; flags 0 waits for that.
  bool Wait(int flags) {
    while (!reaped_) {
      const pid_t got = ::waitpid(pid_, &status_, flags);
      if (got == pid_) {
        reaped_ = true;
      } else if (got == 0) {
        return false;
      } else if (errno != EINTR) {
        // ECHILD: the system reaped it (SIGCHLD ignored by the program); its status is lost.
        reaped_ = true;
        lost_ = true;
      }
    }
    return true;
  }
  HelperEnding Ending() const {
    if (lost_) return {HelperEnding::Kind::kExited, -1};
    if (WIFSIGNALED(status_)) return {HelperEnding::Kind::kSignalled, WTERMSIG(status_)};
    return {HelperEnding::Kind::kExited, WEXITSTATUS(status_)};
  }

 private:
  pid_t pid_;
  int status_ = 0;
  bool reaped_ = false;
  bool lost_ = false;
};

HelperEnding NotStarted(int error) {
  return {HelperEnding::Kind::kNotStarted, error};
}

int MillisecondsLeft(Clock::time_point deadline) {
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now()).count();
  return static_cast<int>(std::clamp<long long>(left, 0, 60'000));
}

bool SetNonBlocking(int fd) {
  const int flags = ::fcntl(fd, F_GETFL);
  return flags >= 0 && ::fcntl(fd, F_SETFL, flags | O_NONBLOCK) == 0;
}

struct SpawnSetup {
  posix_spawn_file_actions_t actions;
  posix_spawnattr_t attributes;
  int failed = 0;

  SpawnSetup(int childInput, int childOutput) {
    posix_spawn_file_actions_init(&actions);
    posix_spawnattr_init(&attributes);
    sigset_t none, defaults;
    sigemptyset(&none);
    sigemptyset(&defaults);
    // Ignored signals stay ignored across exec; the child must die of these as usual.
    for (int sig : {SIGPIPE, SIGXCPU, SIGXFSZ, SIGINT, SIGTERM, SIGQUIT, SIGHUP, SIGCHLD}) {
      sigaddset(&defaults, sig);
    }
    const int steps[] = {
        posix_spawn_file_actions_adddup2(&actions, childInput, STDIN_FILENO),
        posix_spawn_file_actions_adddup2(&actions, childOutput, STDOUT_FILENO),
        posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, "/dev/null", O_WRONLY, 0),
        posix_spawnattr_setsigmask(&attributes, &none),
        posix_spawnattr_setsigdefault(&attributes, &defaults),
        posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF),
    };
    for (int step : steps) failed = failed != 0 ? failed : step;
  }
  ~SpawnSetup() {
    posix_spawn_file_actions_destroy(&actions);
    posix_spawnattr_destroy(&attributes);
  }
  SpawnSetup(const SpawnSetup&) = delete;
  SpawnSetup& operator=(const SpawnSetup&) = delete;
};

}  // namespace

HelperEnding RunHelper(const std::string& program, const std::vector<std::string>& arguments,
                       Bytes input, std::chrono::milliseconds timeout, HelperOutput& output) {
  const Clock::time_point deadline = Clock::now() + timeout;
  // The input goes through a socket so that it can be sent with MSG_NOSIGNAL: a child that has
  // gone gives EPIPE instead of a SIGPIPE that would end this process. Close-on-exec everywhere
  // keeps children started meanwhile by other threads from holding our ends open.
  int ends[2];
  if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends) != 0) return NotStarted(errno);
  Fd inputOurs(ends[0]), inputTheirs(ends[1]);
  if (::pipe2(ends, O_CLOEXEC) != 0) return NotStarted(errno);
  Fd outputOurs(ends[0]), outputTheirs(ends[1]);
  if (!inputTheirs.MoveAboveStandard() || !outputTheirs.MoveAboveStandard() ||
      !SetNonBlocking(inputOurs.get()) || !SetNonBlocking(outputOurs.get())) {
    return NotStarted(errno);
  }

  std::vector<char*> argv;
  argv.push_back(const_cast<char*>(program.c_str()));
  for (const std::string& argument : arguments) argv.push_back(const_cast<char*>(argument.c_str()));
  argv.push_back(nullptr);
  // The child's environment is ours with our process id added, for DieWithParent.
  const std::string parent = std::string(kHelperParentVariable) + "=" + std::to_string(::getpid());
  std::vector<char*> environment;
  const std::size_t nameLength = std::strlen(kHelperParentVariable);
  for (char** entry = environ; entry != nullptr && *entry != nullptr; ++entry) {
    if (std::strncmp(*entry, kHelperParentVariable, nameLength) == 0 && (*entry)[nameLength] == '=')
      continue;
    environment.push_back(*entry);
  }
  environment.push_back(const_cast<char*>(parent.c_str()));
  environment.push_back(nullptr);
  pid_t pid = 0;
  {
    SpawnSetup setup(inputTheirs.get(), outputTheirs.get());
    if (setup.failed != 0) return NotStarted(setup.failed);
    const int failed = ::posix_spawn(&pid, program.c_str(), &setup.actions, &setup.attributes,
                                     argv.data(), environment.data());
    if (failed != 0) return NotStarted(failed);
  }
  Child child(pid);
  inputTheirs.Close();
  outputTheirs.Close();

  std::size_t sent = 0;
  if (input.empty()) inputOurs.Close();
  bool reading = true;
  while (reading) {
    pollfd watched[2] = {{outputOurs.get(), POLLIN, 0}, {inputOurs.get(), POLLOUT, 0}};
    const int ready = ::poll(watched, inputOurs.open() ? 2 : 1, MillisecondsLeft(deadline));
    if (ready < 0) {
      if (errno == EINTR) continue;
      const int error = errno;
      child.Kill();
      return NotStarted(error);
    }
    if (ready == 0) {
      if (Clock::now() < deadline) continue;
      child.Kill();
      return {HelperEnding::Kind::kTimedOut};
    }
    if (inputOurs.open() && watched[1].revents != 0) {
      const ssize_t put =
          ::send(inputOurs.get(), input.data() + sent, input.size() - sent, MSG_NOSIGNAL);
      if (put > 0) sent += static_cast<std::size_t>(put);
      // A child that stops reading has refused the input; what it says about it follows.
      if (sent == input.size() || (put < 0 && errno != EAGAIN && errno != EINTR)) {
        inputOurs.Close();
      }
    }
    if (watched[0].revents != 0) {
      std::span<std::uint8_t> space = output.Space();
      std::uint8_t unexpected[1];
      if (space.empty()) space = unexpected;
      const ssize_t got = ::read(outputOurs.get(), space.data(), space.size());
      if (got > 0) {
        if (space.data() == unexpected) {
          child.Kill();
          return {HelperEnding::Kind::kOverran};
        }
        output.Received(static_cast<std::size_t>(got));
      } else if (got == 0 || (errno != EAGAIN && errno != EINTR)) {
        reading = false;
      }
    }
  }
  inputOurs.Close();
  outputOurs.Close();

  // The child has closed its output and should be ending; it still has until the deadline.
  auto pause = std::chrono::microseconds(50);
  while (!child.Wait(WNOHANG)) {
    if (Clock::now() >= deadline) {
      child.Kill();
      return {HelperEnding::Kind::kTimedOut};
    }
    const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(pause);
    const timespec nap{static_cast<time_t>(seconds.count()),
                       static_cast<long>(std::chrono::nanoseconds(pause - seconds).count())};
    ::nanosleep(&nap, nullptr);
    pause = std::min<std::chrono::microseconds>(pause * 2, std::chrono::milliseconds(10));
  }
  return child.Ending();
}

}  // namespace quillane::codecs
