#include "codecs/atomic_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <random>

namespace quillane::codecs {
namespace {

constexpr std::size_t kBufferSize = 1 << 18;

std::string FolderOf(const std::string& path) {
  const auto slash = path.find_last_of('/');
  if (slash == std::string::npos) return ".";
  if (slash == 0) return "/";
  return path.substr(0, slash);
}

std::string NameOf(const std::string& path) {
  const auto slash = path.find_last_of('/');
  return slash == std::string::npos ? path : path.substr(slash + 1);
}

std::string Reason(int error, const std::string& target) {
  if (error == ENOENT || error == ENOTDIR) {
    return "the folder \"" + FolderOf(target) + "\" does not exist";
  }
  return std::strerror(error);
}

// The file a chain of symbolic links ends at (which need not exist yet).
std::string FollowLinks(std::string path) {
  for (int hops = 0; hops < 40; ++hops) {
    struct stat info {};
    if (::lstat(path.c_str(), &info) != 0 || !S_ISLNK(info.st_mode)) return path;
    char link[PATH_MAX];
    const ssize_t length = ::readlink(path.c_str(), link, sizeof link - 1);
    if (length < 0) return path;
    const std::string to(link, static_cast<std::size_t>(length));
    path = to.front() == '/' ? to : FolderOf(path) + "/" + to;
  }
  throw PictureFileError(std::strerror(ELOOP));
}

bool ModesUnsupported(int error) {
  return error == ENOSYS || error == EPERM || error == ENOTSUP || error == EOPNOTSUPP;
}

}  // namespace

AtomicFile::AtomicFile(std::string target, LinkAtTarget links) {
  if (target.empty() || target.back() == '/') throw PictureFileError("no file name given");
  struct stat old {};
  int found = 0;
  if (links == LinkAtTarget::Follow) {
    target_ = FollowLinks(std::move(target));
    found = ::stat(target_.c_str(), &old);
  } else {
    // The rename at the end replaces whatever name stands here by then; it never follows it.
    target_ = std::move(target);
    found = ::lstat(target_.c_str(), &old);
    if (found == 0 && S_ISLNK(old.st_mode)) throw PictureFileError("it is a symbolic link");
  }
  if (found == 0) {
    if (!S_ISREG(old.st_mode)) throw PictureFileError("it is not a file");
    // The permission bits, not access(): a read-only file stays read-only for root too.
    if ((old.st_mode & S_IWUSR) == 0 || ::access(target_.c_str(), W_OK) != 0) {
      throw PictureFileError("the file is read-only");
    }
    replacing_ = true;
    mode_ = old.st_mode & 07777;
    owner_ = old.st_uid;
    group_ = old.st_gid;
  }
  const std::string folder = FolderOf(target_);
  fd_ = ::open(folder.c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, 0666);
  if (fd_ >= 0) {
    unnamed_ = true;
  } else if (errno == ENOENT || errno == ENOTDIR || errno == EACCES || errno == EROFS) {
    throw PictureFileError(Reason(errno, target_));
  } else {
    // No unnamed files here: hidden, randomly named and created exclusively, so that two saves
    // never share a file and an existing file is never opened by mistake.
    for (int attempt = 0; attempt < 100 && fd_ < 0; ++attempt) {
      temp_ = HiddenName();
      fd_ = ::open(temp_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
      if (fd_ < 0 && errno != EEXIST) {
        const int error = errno;
        temp_.clear();
        throw PictureFileError(Reason(error, target_));
      }
    }
    if (fd_ < 0) {
      temp_.clear();
      throw PictureFileError("no temporary file could be made");
    }
  }
  buffer_.reserve(kBufferSize);
}

std::string AtomicFile::HiddenName() const {
  std::random_device seed;
  std::mt19937_64 random(seed());
  char suffix[24];
  const int suffixLength =
      std::snprintf(suffix, sizeof suffix, ".%012llx.tmp",
                    static_cast<unsigned long long>(random() & 0xFFFFFFFFFFFFull));
  // The target's name is shortened so that the hidden one, a dot and the suffix longer, still
  // fits where the target itself does: any name the file system takes can be saved.
  const std::size_t room = NAME_MAX - 1 - static_cast<std::size_t>(suffixLength);
  return FolderOf(target_) + "/." + NameOf(target_).substr(0, room) + suffix;
}

AtomicFile::~AtomicFile() {
  if (fd_ >= 0) ::close(fd_);
  if (!committed_ && !temp_.empty()) ::unlink(temp_.c_str());
}

void AtomicFile::Fail(int error) {
  if (fd_ >= 0) ::close(fd_);
  fd_ = -1;
  if (!temp_.empty()) ::unlink(temp_.c_str());
  temp_.clear();
  throw PictureFileError(Reason(error, target_));
}

void AtomicFile::Flush() {
  const char* data = buffer_.data();
  std::size_t left = buffer_.size();
  while (left > 0) {
    const ssize_t written = ::write(fd_, data, left);
    if (written < 0) {
      if (errno == EINTR) continue;
      Fail(errno);
    }
    if (written == 0) Fail(ENOSPC);
    data += written;
    left -= static_cast<std::size_t>(written);
  }
  buffer_.clear();
}

void AtomicFile::Write(const void* data, std::size_t size) {
  if (fd_ < 0) throw PictureFileError("the file is closed");
  const auto* bytes = static_cast<const char*>(data);
  while (size > 0) {
    const std::size_t room = kBufferSize - buffer_.size();
    const std::size_t part = size < room ? size : room;
    buffer_.insert(buffer_.end(), bytes, bytes + part);
    bytes += part;
    size -= part;
    if (buffer_.size() == kBufferSize) Flush();
  }
}

void AtomicFile::Commit() {
  if (fd_ < 0) throw PictureFileError("the file is closed");
  Flush();
  if (replacing_) {
    // Owner and group first: changing them may clear the set-ID bits that fchmod then restores.
    // Run by root, the file stays its owner's (else its owner could no longer save it).
    if (::fchown(fd_, owner_, group_) != 0 && ::fchown(fd_, static_cast<uid_t>(-1), group_) != 0) {
      // Not a member of that group either: the file is ours, as any new file would be.
    }
    // File systems without Unix modes (FAT sticks, some network shares) refuse them: the file
    // then has whatever the mount gives every file, which is no reason not to save it.
    if (::fchmod(fd_, mode_) != 0 && !ModesUnsupported(errno)) Fail(errno);
  }
  if (::fsync(fd_) != 0 && errno != EINVAL) Fail(errno);
  if (unnamed_) {
    // The complete file gets a name of its own beside the target, then takes the target's.
    // Only a crash in the instant between the two can leave that name behind.
    const std::string self = "/proc/self/fd/" + std::to_string(fd_);
    for (int attempt = 0; attempt < 100 && temp_.empty(); ++attempt) {
      temp_ = HiddenName();
      if (::linkat(AT_FDCWD, self.c_str(), AT_FDCWD, temp_.c_str(), AT_SYMLINK_FOLLOW) != 0) {
        const int error = errno;
        temp_.clear();
        if (error != EEXIST) Fail(error);
      }
    }
    if (temp_.empty()) Fail(EEXIST);
  }
  const int fd = fd_;
  fd_ = -1;
  if (::close(fd) != 0) {
    const int error = errno;
    ::unlink(temp_.c_str());
    temp_.clear();
    throw PictureFileError(Reason(error, target_));
  }
  if (::rename(temp_.c_str(), target_.c_str()) != 0) {
    const int error = errno;
    ::unlink(temp_.c_str());
    temp_.clear();
    throw PictureFileError(std::strerror(error));
  }
  committed_ = true;
  // Make the rename itself durable; a failure here cannot lose the new file any more.
  const int folder = ::open(FolderOf(target_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (folder >= 0) {
    ::fsync(folder);
    ::close(folder);
  }
}

}  // namespace quillane::codecs
