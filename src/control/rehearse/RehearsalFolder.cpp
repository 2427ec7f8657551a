// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/rehearse/RehearsalFolder.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <system_error>
#include <utility>

#include "base/FileDescriptor.h"

namespace tavisk::control {
namespace {

constexpr const char* makeFolder = "make the folder of the rehearsal";

Result<std::string> makeTemporary() {
  std::string path = "/tmp/taviskctl-rehearsal-XXXXXX";
  if (!::mkdtemp(path.data())) return systemFailure(makeFolder, path, errno);
  return path;
}

/// One that is there has to be this user's own.
Result<void> takeOver(const std::string& path) {
  const FileDescriptor folder(::open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
  if (!folder) return systemFailure(makeFolder, path, errno);
  struct stat status {};
  if (::fstat(folder.number(), &status) != 0) return systemFailure(makeFolder, path, errno);
  if (status.st_uid != ::geteuid()) return Failure{makeFolder, path, "it is somebody else's"};
  std::error_code error;
  const bool isEmpty = std::filesystem::is_empty(path, error);
  if (error) return systemFailure(makeFolder, path, error.value());
  if (!isEmpty) return Failure{makeFolder, path, "it is not empty"};
  if (::fchmod(folder.number(), S_IRWXU) != 0) return systemFailure(makeFolder, path, errno);
  return {};
}

Result<std::string> makeKept(const std::string& path) {
  const auto absolute = std::filesystem::absolute(path).string();
  if (::mkdir(absolute.c_str(), S_IRWXU) != 0 && errno != EEXIST) return systemFailure(makeFolder, path, errno);
  const auto taken = takeOver(absolute);
  if (!taken) return taken.failure();
  return absolute;
}

}  // namespace

Result<RehearsalFolder> RehearsalFolder::make(const std::optional<std::string>& kept) {
  if (kept && kept->empty()) return Failure{makeFolder, "", "its name is empty"};
  auto path = kept ? makeKept(*kept) : makeTemporary();
  if (!path) return path.failure();
  return RehearsalFolder(std::move(path).value(), kept.has_value());
}

RehearsalFolder::RehearsalFolder(RehearsalFolder&& other) noexcept
    : _path(std::exchange(other._path, {})), _isKept(other._isKept) {}

RehearsalFolder::~RehearsalFolder() {
  removeTemporary();
}

void RehearsalFolder::removeTemporary() const {
  if (_isKept || _path.empty()) return;
  std::error_code error;
  std::filesystem::remove_all(_path, error);
}

}  // namespace tavisk::control
