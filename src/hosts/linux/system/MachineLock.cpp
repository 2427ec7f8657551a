// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/MachineLock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <string>

#include "base/Text.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestWait{15};
constexpr std::chrono::milliseconds betweenTries{5};
constexpr unsigned folderMode = 0750;
constexpr unsigned fileMode = 0660;
constexpr std::size_t processIdLimit = 32;

/// For who waits.
void writeOwnId(const FileDescriptor& file) {
  const auto id = std::to_string(::getpid()) + "\n";
  if (::ftruncate(file.number(), 0) == 0)
    static_cast<void>(::pwrite(file.number(), id.data(), id.size(), 0) == static_cast<ssize_t>(id.size()));
}

}  // namespace

Result<FileDescriptor> MachineLock::hold() const {
  auto file = openFile();
  if (!file) return retold(file.failure(), "lock", ownfile::machineLock);
  int error = 0;
  const auto isTaken = [&] {
    error = ::flock(file->number(), LOCK_EX | LOCK_NB) == 0 ? 0 : errno;
    return error != EWOULDBLOCK && error != EINTR;
  };
  if (!isTaken()) {
    const auto retry = _runLoop.every(betweenTries, [] {});
    if (!_runLoop.runUntil(RunLoop::Clock::now() + longestWait, isTaken)) return whoHolds(*file);
  }
  if (error != 0) return systemFailure("lock", ownfile::machineLock, error);
  writeOwnId(*file);
  return file;
}

/// Usually the machine made both when it started (tmpfiles.d(5)). Without that only root gets past here.
Result<FileDescriptor> MachineLock::openFile() const {
  constexpr int flags = O_RDWR | O_NOFOLLOW | O_NONBLOCK;
  auto file = _root.open(ownfile::machineLock, flags);
  const bool isRefused = !file && file.failure().code == std::errc::permission_denied;
  if (file || (!isRefused && !isAbsent(file.failure()))) return file;
  if (auto failure = whyNeedsRoot("lock", ownfile::machineLock)) return *failure;
  if (isRefused) return file;
  if (auto made = makeFolder(); !made) return made.failure();
  file = _root.open(ownfile::machineLock, flags | O_CREAT, fileMode);
  if (!file) return file;
  struct stat folder {};
  const auto parent = _root.open(ownfile::machineLockFolder, O_PATH | O_DIRECTORY);
  if (!parent || ::fstat(parent->number(), &folder) != 0) return file;
  if (::fchown(file->number(), static_cast<uid_t>(-1), folder.st_gid) != 0 || ::fchmod(file->number(), fileMode) != 0)
    return systemFailure("lock", ownfile::machineLock, errno);
  return file;
}

Result<void> MachineLock::makeFolder() const {
  const auto present = _root.isThere(ownfile::machineLockFolder);
  if (!present) return present.failure();
  if (*present) return {};
  if (auto made = _root.makeFolders(ownfile::machineLockFolder); !made) return made;
  const auto folder = _root.open(ownfile::machineLockFolder, O_RDONLY | O_DIRECTORY);
  if (!folder) return folder.failure();
  if (::fchmod(folder->number(), folderMode) != 0) return systemFailure("lock", ownfile::machineLock, errno);
  return {};
}

Failure MachineLock::whoHolds(const FileDescriptor& file) const {
  std::string text(processIdLimit, '\0');
  const auto size = ::pread(file.number(), text.data(), text.size(), 0);
  const auto id = leadingInteger(text.substr(0, size > 0 ? static_cast<std::size_t>(size) : 0));
  const auto holder = id > 0 ? "process " + std::to_string(id) : "another run";
  return {"lock", ownfile::machineLock, holder + " is changing a setting of this machine"};
}

}  // namespace tavisk
