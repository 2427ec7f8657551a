// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchLogs.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

constexpr const char* effectsPath = "/effects.log";
constexpr const char* systemPath = "/system.log";

/// Takes the beginning of a line back that found no room, unless another run has appended to it.
void takeBack(const FileDescriptor& file, off_t sizeBefore, ssize_t written) {
  struct stat status {};
  const bool isLast = ::fstat(file.number(), &status) == 0 && status.st_size == sizeBefore + written;
  if (isLast && ::ftruncate(file.number(), sizeBefore) != 0) return;  // the half line stays
}

std::string oneLine(std::string_view message) {
  if (message.ends_with('\n')) message.remove_suffix(1);
  std::string line;
  for (const char byte : message) {
    if (byte == '\n')
      line += "\\n";
    else
      line += byte;
  }
  return line;
}

Failure notALog(const std::string& path) {
  return {"append to", path, "not a regular file"};
}

/// Appends a line and its newline in one piece; the file is made when it is missing. Several runs may append.
Result<void> appendLine(const SystemRoot& root, const std::string& path, std::string line) {
  const auto file = root.open(path, O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file.failure();
  struct stat before {};
  if (::fstat(file->number(), &before) != 0) return systemFailure("look at", path, errno);
  if (!S_ISREG(before.st_mode)) return notALog(path);
  line += "\n";
  const auto written = ::write(file->number(), line.data(), line.size());
  if (written == static_cast<ssize_t>(line.size())) return {};
  const int error = written < 0 ? errno : ENOSPC;
  if (written > 0) takeBack(*file, before.st_size, written);
  return systemFailure("append to", path, error);
}

}  // namespace

std::optional<Failure> EffectsLog::whyUnusable() const {
  const auto file = orAbsent(_folder.open(effectsPath, O_PATH | O_NOFOLLOW));
  if (!file) return file.failure();
  struct stat status {};
  const bool isLog = !*file || (::fstat((*file)->number(), &status) == 0 && S_ISREG(status.st_mode));
  return isLog ? std::nullopt : std::optional(notALog(effectsPath));
}

void EffectsLog::record(const Effect& effect) {
  static_cast<void>(appendLine(_folder, effectsPath, toJson(effect)));
}

void ScratchSystemLog::write(const std::string& message) {
  const auto written = appendLine(_folder, systemPath, oneLine(message));
  if (!written) _effects.recordFailure("System Log", written.failure(), message);
}

}  // namespace tavisk
