// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/SystemRoot.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>

#include "base/Text.h"
#include "hosts/shared/FolderWriter.h"
#include "hosts/shared/OpenBeneath.h"
#include "hosts/shared/PathResolver.h"

namespace tavisk {
namespace {

constexpr unsigned folderMode = 0755;

std::optional<Failure> whyUnusable(const std::string& path) {
  if (!path.starts_with('/')) return Failure{"open", path, "not an absolute path"};
  if (path.find('\0') != std::string::npos) return Failure{"open", path, "a NUL byte in the path"};
  return std::nullopt;
}

std::int64_t nanoseconds(const timespec& time) {
  return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

Result<void> needsRegularFile(const FileDescriptor& file, const std::string& path) {
  struct stat status {};
  if (::fstat(file.number(), &status) != 0) return systemFailure("read", path, errno);
  if (!S_ISREG(status.st_mode)) return Failure{"read", path, "not a regular file"};
  return {};
}

/// The same as SystemRoot::isThere() where no link can lead out, in one call for its three.
Result<bool> isInSystem(const std::string& path) {
  if (auto why = whyUnusable(path)) return *why;
  if (::faccessat(AT_FDCWD, path.c_str(), F_OK, AT_EACCESS) == 0) return true;
  auto failure = systemFailure("look for", path, errno);
  if (isAbsent(failure)) return false;
  return failure;
}

/// The path as names with "/" before them, where one look is enough for it: it exists, without a link in it.
std::optional<std::string> plainPath(const FileDescriptor& prefix, const std::string& path) {
  std::string plain;
  for (const auto& name : split(path, "/")) {
    if (name == "..") return std::nullopt;
    if (name != ".") plain += "/" + name;
  }
  if (plain.empty()) plain.push_back('/');
  return existsWithoutLinks(prefix, plain) ? std::optional(plain) : std::nullopt;
}

/// A path cut before its last name.
struct Place {
  std::string folder;
  std::string name;
};

Result<Place> placeOf(const std::string& path) {
  const auto end = path.find_last_not_of('/');
  if (end == std::string::npos) return systemFailure("write", path, EISDIR);
  const auto start = path.rfind('/', end) + 1;
  Place place{path.substr(0, start), path.substr(start, end + 1 - start)};
  if (place.name == "." || place.name == "..") return systemFailure("write", path, EISDIR);
  return place;
}

/// The folder of that name, made when it is missing, and its entry on the disk.
Result<FileDescriptor> makeNamedFolder(const FileDescriptor& parent, const std::string& name, const std::string& path) {
  constexpr int flags = O_RDONLY | O_DIRECTORY | O_NOFOLLOW;
  auto present = openNamed(parent, name, flags);
  if (present) return present;
  if (present.failure().code != std::errc::no_such_file_or_directory)
    return retold(present.failure(), "make folder", path);
  if (::mkdirat(parent.number(), name.c_str(), folderMode) != 0 && errno != EEXIST)
    return systemFailure("make folder", path, errno);
  auto made = openNamed(parent, name, flags);
  if (!made) return retold(made.failure(), "make folder", path);
  if (::fchmod(made->number(), folderMode) != 0 || ::fsync(parent.number()) != 0)
    return systemFailure("make folder", path, errno);
  return made;
}

}  // namespace

Result<FileDescriptor> SystemRoot::openPrefix(const std::string& path) const {
  if (const auto failure = whyUnusable(path)) return *failure;
  const auto number = ::open(_prefix.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
  if (number < 0) return systemFailure("open", path, errno);
  return FileDescriptor(number);
}

Result<FileDescriptor> SystemRoot::open(const std::string& path, int flags, unsigned mode) const {
  const auto prefix = openPrefix(path);
  if (!prefix) return prefix.failure();
  return openBeneath(*prefix, path, flags, mode);
}

Result<bool> SystemRoot::isThere(const std::string& path) const {
  const auto found = orAbsent(open(path, O_PATH));
  if (!found) return retold(found.failure(), "look for", path);
  return found->has_value();
}

Result<std::vector<std::string>> SystemRoot::thoseThere(std::vector<std::string> paths) const {
  std::optional<Failure> failure;
  std::erase_if(paths, [&](const auto& path) {
    if (failure) return false;
    const auto found = _prefix == "/" ? isInSystem(path) : isThere(path);
    if (!found) failure = found.failure();
    return found && !*found;
  });
  if (failure) return *failure;
  return paths;
}

std::optional<FileStamp> SystemRoot::stamp(const std::string& path) const {
  struct stat status {};
  if (::lstat((_prefix + path).c_str(), &status) != 0) return std::nullopt;
  if (S_ISLNK(status.st_mode)) {
    const auto target = open(path, O_PATH);
    if (!target || ::fstat(target->number(), &status) != 0) return std::nullopt;
  }
  return FileStamp{status.st_dev, status.st_ino, status.st_size, nanoseconds(status.st_mtim),
                   nanoseconds(status.st_ctim)};
}

Result<FileDescriptor> SystemRoot::openRegular(const std::string& path) const {
  const auto seen = open(path, O_PATH);
  if (!seen) return seen.failure();
  // Only looked at so far: to open a device may already do something.
  if (const auto isRegular = needsRegularFile(*seen, path); !isRegular) return isRegular.failure();
  auto file = open(path, O_RDONLY | O_NONBLOCK | O_NOCTTY);
  if (!file) return file;
  if (const auto isRegular = needsRegularFile(*file, path); !isRegular) return isRegular.failure();
  return file;
}

Result<std::string> SystemRoot::read(const std::string& path, std::size_t limit) const {
  const auto file = openRegular(path);
  if (!file) return file.failure();
  return readAll(*file, limit, path);
}

Result<std::string> SystemRoot::readBeginning(const std::string& path, std::size_t length) const {
  const auto file = openRegular(path);
  if (!file) return file.failure();
  return tavisk::readBeginning(*file, length, path);
}

Result<std::string> SystemRoot::readLink(const std::string& path) const {
  const auto link = open(path, O_PATH | O_NOFOLLOW);
  if (!link) return link.failure();
  return targetOf(*link, path);
}

Result<std::vector<std::string>> SystemRoot::list(const std::string& path) const {
  const auto folder = open(path, O_RDONLY | O_DIRECTORY);
  if (!folder) return folder.failure();
  return namesIn(*folder, path);
}

Result<std::string> SystemRoot::standardized(const std::string& path) const {
  const auto prefix = openPrefix(path);
  if (!prefix) return prefix.failure();
  if (auto plain = plainPath(*prefix, path)) return std::move(*plain);
  return PathResolver(*prefix).resolve(path);
}

Result<FileDescriptor> SystemRoot::makeFolder(const std::string& path) const {
  if (const auto made = makePrefix(path); !made) return made.failure();
  const auto resolved = standardized(path);
  if (!resolved) return resolved.failure();
  auto folder = open("/", O_RDONLY | O_DIRECTORY);
  for (const auto& name : split(*resolved, "/")) {
    if (folder) folder = makeNamedFolder(*folder, name, path);
  }
  return folder;
}

Result<void> SystemRoot::makePrefix(const std::string& path) const {
  const bool isMade = ::mkdir(_prefix.c_str(), folderMode) == 0;
  if (!isMade && errno == EEXIST) return {};
  if (!isMade) return systemFailure("make folder", path, errno);
  const FileDescriptor parent(::open((_prefix + "/..").c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (parent && ::fsync(parent.number()) == 0) return {};
  return systemFailure("make folder", path, errno);
}

Result<void> SystemRoot::makeFolders(const std::string& path) const {
  const auto folder = makeFolder(path);
  if (!folder) return folder.failure();
  return {};
}

Result<void> SystemRoot::write(const std::string& path, std::string_view contents, unsigned modeWhenNew) const {
  if (auto made = makePrefix(path); !made) return made;
  const auto resolved = standardized(path);
  if (!resolved) return resolved.failure();
  const auto place = placeOf(*resolved);
  if (!place) return place.failure();
  const auto folder = makeFolder(place->folder);
  if (!folder) return folder.failure();
  return FolderWriter(*folder, path).writeFile(place->name, contents, modeWhenNew);
}

Result<void> SystemRoot::writeLink(const std::string& path, const std::string& target) const {
  const auto place = placeOf(path);
  if (!place) return place.failure();
  const auto folder = makeFolder(place->folder);
  if (!folder) return folder.failure();
  return FolderWriter(*folder, path).writeLink(place->name, target);
}

Result<void> SystemRoot::remove(const std::string& path) const {
  const auto place = placeOf(path);
  if (!place) return place.failure();
  const auto prefix = openPrefix(path);
  if (!prefix) return prefix.failure();
  const auto folder = openBeneath(*prefix, place->folder, O_RDONLY | O_DIRECTORY);
  if (folder) return FolderWriter(*folder, path).remove(place->name);
  if (isAbsent(folder.failure())) return {};
  return retold(folder.failure(), folder.failure().tried, path);
}

}  // namespace tavisk
