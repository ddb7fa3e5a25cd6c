#include "codecs/render_child.h"

#include <fcntl.h>
#include <signal.h>
#include <sys/prctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>

#include "codecs/helper_parent.h"

namespace quillane::codecs::render_child {
namespace {

#if defined(__SANITIZE_ADDRESS__)
constexpr bool kAddressSanitizer = true;
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
constexpr bool kAddressSanitizer = true;
#else
constexpr bool kAddressSanitizer = false;
#endif
#else
constexpr bool kAddressSanitizer = false;
#endif

int gReply = STDOUT_FILENO;

}  // namespace

bool SetLimit(int resource, rlim_t soft, rlim_t hard) {
  rlimit limit{};
  if (getrlimit(resource, &limit) != 0) return false;
  hard = std::min(hard, limit.rlim_max);  // RLIM_INFINITY is the largest value
  limit = {std::min(soft, hard), hard};
  return setrlimit(resource, &limit) == 0;
}

bool DieWithParent() {
  if (::prctl(PR_SET_PDEATHSIG, SIGKILL) != 0) return false;
  // The parent may have ended between starting us and the line above; we then belong to
  // another process already, and no signal will come.
  const char* starter = std::getenv(kHelperParentVariable);
  std::uint64_t parent = 0;
  if (starter == nullptr || !ParseCount(starter, 0x7FFFFFFF, parent)) return true;  // run by hand
  return static_cast<std::uint64_t>(::getppid()) == parent;
}

bool LimitSelf(rlim_t cpuSoft, rlim_t cpuHard, std::uint64_t addressSpace) {
  bool done = DieWithParent() && SetLimit(RLIMIT_CORE, 0, 0) &&
              SetLimit(RLIMIT_CPU, cpuSoft, cpuHard) && SetLimit(RLIMIT_FSIZE, 0, 0);
  if (!kAddressSanitizer) done = done && SetLimit(RLIMIT_AS, addressSpace, addressSpace);
  return done;
}

bool KeepReplyPrivate() {
  const int reply = ::fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
  if (reply < 0) return false;
  const int null = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
  if (null < 0 || ::dup2(null, STDOUT_FILENO) < 0) return false;
  ::close(null);
  gReply = reply;
  return true;
}

bool WriteAll(const void* data, std::size_t size) {
  const auto* at = static_cast<const std::uint8_t*>(data);
  while (size > 0) {
    const ssize_t put = ::write(gReply, at, size);
    if (put < 0) {
      if (errno == EINTR) continue;
      return false;
    }
    at += put;
    size -= static_cast<std::size_t>(put);
  }
  return true;
}

int Answer(metafile_render::Reply reply, std::uint32_t width, std::uint32_t height) {
  const std::uint32_t header[3] = {static_cast<std::uint32_t>(reply), width, height};
  return WriteAll(header, sizeof header) ? 0 : 1;
}

bool ReadAll(std::vector<std::uint8_t>& bytes) {
  std::size_t done = 0;
  while (done < bytes.size()) {
    const ssize_t got = ::read(STDIN_FILENO, bytes.data() + done, bytes.size() - done);
    if (got < 0 && errno == EINTR) continue;
    if (got <= 0) return false;
    done += static_cast<std::size_t>(got);
  }
  return true;
}

bool ParseCount(const char* text, std::uint64_t most, std::uint64_t& value) {
  char* end = nullptr;
  errno = 0;
  const unsigned long long parsed = std::strtoull(text, &end, 10);
  if (errno != 0 || end == text || *end != '\0' || parsed > most || text[0] == '-') return false;
  value = parsed;
  return true;
}

}  // namespace quillane::codecs::render_child
