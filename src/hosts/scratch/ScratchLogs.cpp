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

/// The file is made when it is missing.
Result<void> appendTo(const SystemRoot& root, const std::string& path, const std::string& line) {
  const auto file = root.open(path, O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file.failure();
  struct stat status {};
  if (::fstat(file->number(), &status) != 0) return systemFailure("look at", path, errno);
  if (!S_ISREG(status.st_mode)) return notALog(path);
  const auto appended = appendLine(*file, line + "\n", path);
  if (!appended) return retold(appended.failure(), "append to", path);
  return {};
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
  static_cast<void>(appendTo(_folder, effectsPath, toJson(effect)));
}

void ScratchSystemLog::write(const std::string& message) {
  const auto written = appendTo(_folder, systemPath, oneLine(message));
  if (!written) _effects.recordFailure("System Log", written.failure(), message);
}

}  // namespace tavisk
