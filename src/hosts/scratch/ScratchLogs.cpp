// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/scratch/ScratchLogs.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "base/Result.h"

namespace tavisk {
namespace {

/// Takes the beginning of a line back that found no room, unless another run has appended to it.
void takeBack(const FileDescriptor& file, off_t sizeBefore, ssize_t written) {
  struct stat status {};
  bool isLast = ::fstat(file.number(), &status) == 0 && status.st_size == sizeBefore + written;
  if (isLast && ::ftruncate(file.number(), sizeBefore) != 0) return;  // the half line stays
}

std::string oneLine(std::string_view message) {
  if (message.ends_with('\n')) message.remove_suffix(1);
  std::string line;
  for (char byte : message) {
    if (byte == '\n') {
      line += "\\n";
    } else {
      line += byte;
    }
  }
  return line;
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

void EffectsLog::record(const Effect& effect) {
  (void)appendLine(_folder, "/effects.log", toJson(effect));
}

void ScratchSystemLog::write(const std::string& message) {
  auto written = appendLine(_folder, "/system.log", oneLine(message));
  if (!written) _effects.recordFailure("System Log", written.failure(), message);
}

}  // namespace tavisk
