// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/FileDescriptor.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <thread>

namespace tavisk {
namespace {

/// Takes what was written off the front of the contents. 0, or the errno by which a write failed.
int writeFrom(std::string_view& contents, const FileDescriptor& file) {
  while (!contents.empty()) {
    const auto count = ::write(file.number(), contents.data(), contents.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return errno;
    contents.remove_prefix(static_cast<std::size_t>(count));
  }
  return 0;
}

/// Fills so many bytes, or as many as there are, by reads that are told where to, how many at most and how many are
/// there.
template <typename Read>
Result<std::string> filled(std::size_t length, const std::string& path, const Read& read) {
  std::string bytes(length, '\0');
  std::size_t size = 0;
  while (size < length) {
    const auto count = read(&bytes[size], length - size, size);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return systemFailure("read", path, errno);
    if (count == 0) break;
    size += static_cast<std::size_t>(count);
  }
  bytes.resize(size);
  return bytes;
}

/// A record lock on a whole file, as it tells two runs apart also where both have the descriptor from one parent.
class AppendLock final {
 public:
  explicit AppendLock(const FileDescriptor& file) : _file(file) {
    constexpr int attempts = 50;
    for (int attempt = 0; attempt < attempts && !set(F_WRLCK) && (errno == EAGAIN || errno == EACCES); ++attempt) {
      std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
  }
  AppendLock(const AppendLock&) = delete;
  AppendLock& operator=(const AppendLock&) = delete;
  ~AppendLock() { set(F_UNLCK); }

 private:
  bool set(short type) const {
    struct flock lock {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    return ::fcntl(_file.number(), F_SETLK, &lock) == 0;
  }

  const FileDescriptor& _file;
};

bool isAppending(const FileDescriptor& file) {
  return (::fcntl(file.number(), F_GETFL) & O_APPEND) != 0;
}

/// Where the next byte of a regular file goes; negative for what has no such place.
off_t placeOfNextByte(const FileDescriptor& file) {
  struct stat status {};
  if (::fstat(file.number(), &status) != 0 || !S_ISREG(status.st_mode)) return -1;
  return isAppending(file) ? status.st_size : ::lseek(file.number(), 0, SEEK_CUR);
}

bool takeBack(const FileDescriptor& file, off_t begin, std::size_t written) {
  struct stat status {};
  const auto end = begin + static_cast<off_t>(written);
  if (begin < 0 || ::fstat(file.number(), &status) != 0 || status.st_size != end) return false;
  if (::ftruncate(file.number(), begin) != 0) return false;
  return isAppending(file) || ::lseek(file.number(), begin, SEEK_SET) == begin;
}

}  // namespace

FileDescriptor& FileDescriptor::operator=(FileDescriptor&& other) noexcept {
  std::swap(_number, other._number);
  return *this;
}

FileDescriptor::~FileDescriptor() {
  if (_number >= 0) ::close(_number);
}

Result<std::string> readAll(const FileDescriptor& file, std::size_t limit, const std::string& path) {
  std::string contents;
  std::array<char, 65536> buffer{};
  while (true) {
    const auto count = ::read(file.number(), buffer.data(), buffer.size());
    if (count == 0) return contents;
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return systemFailure("read", path, errno);
    contents.append(buffer.data(), static_cast<std::size_t>(count));
    if (contents.size() > limit) return Failure{"read", path, "larger than " + std::to_string(limit) + " bytes"};
  }
}

Result<std::string> readBeginning(const FileDescriptor& file, std::size_t length, const std::string& path) {
  return filled(length, path, [&](char* to, std::size_t room, std::size_t) { return ::read(file.number(), to, room); });
}

Result<std::string> readAt(const FileDescriptor& file, std::uint64_t place, std::size_t length,
                           const std::string& path) {
  return filled(length, path, [&](char* to, std::size_t room, std::size_t size) {
    return ::pread(file.number(), to, room, static_cast<off_t>(place + size));
  });
}

Result<void> writeAll(const FileDescriptor& file, std::string_view contents, const std::string& path) {
  const int error = writeFrom(contents, file);
  return error == 0 ? Result<void>() : systemFailure("write", path, error);
}

Result<void> appendLine(const FileDescriptor& file, std::string_view line, const std::string& path) {
  const AppendLock lock(file);
  const auto begin = placeOfNextByte(file);
  auto rest = line;
  const int error = writeFrom(rest, file);
  if (error == 0) return {};
  const auto written = line.size() - rest.size();
  if (written > 0 && !takeBack(file, begin, written)) static_cast<void>(!::write(file.number(), "\n", 1));
  return systemFailure("write", path, error);
}

}  // namespace tavisk
