// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/LogFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "platform/SystemFailure.h"

namespace tavisk {
namespace {

/// Takes the beginning of a line back that found no room, unless another run has appended to it.
void takeBack(const FileDescriptor& file, off_t sizeBefore, ssize_t written) {
  struct stat status {};
  bool isLast = ::fstat(file.number(), &status) == 0 && status.st_size == sizeBefore + written;
  if (isLast && ::ftruncate(file.number(), sizeBefore) != 0) return;  // the half line stays
}

}  // namespace

Result<void> appendLine(const SystemRoot& root, const std::string& path, std::string line) {
  auto file = root.open(path, O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file.failure();
  struct stat before {};
  if (::fstat(file->number(), &before) != 0) return systemFailure("look at", path, errno);
  line += "\n";
  auto written = ::write(file->number(), line.data(), line.size());
  if (written == static_cast<ssize_t>(line.size())) return {};
  auto failure = systemFailure("append to", path, written < 0 ? errno : ENOSPC);
  if (written > 0) takeBack(*file, before.st_size, written);
  return failure;
}

}  // namespace tavisk
