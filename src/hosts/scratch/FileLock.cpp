// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/FileLock.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>
#include <thread>

namespace tavisk {
namespace {
constexpr std::chrono::milliseconds betweenTries{1};
}

Result<FileDescriptor> lockFile(const SystemRoot& root, const std::string& path, std::chrono::milliseconds patience) {
  auto file = root.open(path, O_RDONLY | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file;
  const auto deadline = std::chrono::steady_clock::now() + patience;
  while (::flock(file->number(), LOCK_EX | LOCK_NB) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) return systemFailure("lock", path, errno);
    if (std::chrono::steady_clock::now() > deadline) return Failure{"lock", path, "another run keeps it locked"};
    std::this_thread::sleep_for(betweenTries);
  }
  return file;
}

}  // namespace tavisk
