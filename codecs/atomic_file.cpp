#include "codecs/atomic_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
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

}  // namespace

AtomicFile::AtomicFile(std::string target) : target_(std::move(target)) {
  if (target_.empty() || target_.back() == '/') {
    throw PictureFileError("no file name given");
  }
  // Hidden, randomly named and created exclusively, so that two saves never share a file and
  // an existing file is never opened by mistake.
  std::random_device seed;
  std::mt19937_64 random(seed());
  const std::string prefix = FolderOf(target_) + "/." + NameOf(target_) + ".";
  for (int attempt = 0; attempt < 100; ++attempt) {
    char suffix[24];
    std::snprintf(suffix, sizeof suffix, "%012llx.tmp",
                  static_cast<unsigned long long>(random() & 0xFFFFFFFFFFFFull));
    temp_ = prefix + suffix;
    fd_ = ::open(temp_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
    if (fd_ >= 0) break;
    if (errno != EEXIST) {
      const int error = errno;
      temp_.clear();
      throw PictureFileError(Reason(error, target_));
    }
  }
  if (fd_ < 0) {
    temp_.clear();
    throw PictureFileError("no temporary file could be made");
  }
  buffer_.reserve(kBufferSize);
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
  if (::fsync(fd_) != 0 && errno != EINVAL) Fail(errno);
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
