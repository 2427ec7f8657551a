// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/CopiedFiles.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <utility>

#include "base/FileDescriptor.h"
#include "base/Path.h"
#include "base/Text.h"

namespace tavisk {

bool CopiedFiles::exists(const std::string& path) {
  const bool isThere = _files.exists(path);
  if (isThere) copyFile(path, "");
  return isThere;
}

Result<std::string> CopiedFiles::read(const std::string& path, std::size_t limit) {
  auto contents = _files.read(path, limit);
  if (contents) copyFile(path, *contents);
  return contents;
}

Result<std::string> CopiedFiles::readBeginning(const std::string& path, std::size_t length) {
  auto contents = _files.readBeginning(path, length);
  if (contents) copyFile(path, *contents);
  return contents;
}

Result<std::string> CopiedFiles::standardized(const std::string& path) {
  auto leadsTo = _files.standardized(path);
  if (!leadsTo) return leadsTo;
  const std::scoped_lock lock(_mutex);
  const auto way = copyWayTo(path);
  if (!way)
    tell(way.failure());
  else if (_files.exists(*leadsTo))
    tell(makeFolder(*way));
  return leadsTo;
}

/// The path without the links that lead to it, which the copy has then.
Result<std::string> CopiedFiles::copyWayTo(const std::string& path) {
  if (_files.standardized(path).valueOr("") == path) return path;
  const auto parts = split(path, "/");
  std::string reached;
  for (const auto& part : parts) {
    const auto here = std::string(reached).append("/").append(part);
    const auto leadsTo = _files.standardized(here);
    if (!leadsTo) return leadsTo.failure();
    auto copied = *leadsTo == here ? Result<void>() : copyLink(here, *leadsTo);
    const bool isFolder = &part != &parts.back() && _files.exists(*leadsTo);
    if (copied && isFolder) copied = makeFolder(*leadsTo);
    if (!copied) return copied.failure();
    reached = *leadsTo == "/" ? "" : *leadsTo;
  }
  return reached.empty() ? "/" : reached;
}

/// "." and ".." are none.
Result<void> CopiedFiles::copyLink(const std::string& path, const std::string& target) {
  const auto name = baseName(path);
  return name == "." || name == ".." ? Result<void>() : _copy.writeLink(path, target);
}

Result<void> CopiedFiles::makeFolder(const std::string& path) {
  for (auto file = _unopened.begin(); file != _unopened.end();) {
    if (path != *file && !path.starts_with(*file + "/")) {
      ++file;
      continue;
    }
    if (auto removed = _copy.remove(*file); !removed) return removed;
    file = _unopened.erase(file);
  }
  return _copy.makeFolders(path);
}

/// What is known already of a file is not replaced by less.
void CopiedFiles::copyFile(const std::string& path, const std::string& contents) {
  const std::scoped_lock lock(_mutex);
  const auto way = copyWayTo(path);
  if (!way) return tell(way.failure());
  const auto isThere = _copy.isThere(*way);
  if (!isThere) return tell(isThere.failure());
  if (*isThere && contents.empty()) return;
  tell(write(*way, contents));
  if (contents.empty())
    _unopened.insert(*way);
  else
    _unopened.erase(*way);
}

/// Nobody needs a copy after a power cut: it is not synced.
Result<void> CopiedFiles::write(const std::string& path, const std::string& contents) {
  if (auto made = makeFolder(parentFolder(path)); !made) return made;
  const auto file = _copy.open(path, O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW, S_IRUSR | S_IWUSR);
  if (!file) return file.failure();
  return writeAll(*file, contents, path);
}

void CopiedFiles::tell(const Result<void>& copied) {
  if (copied || std::exchange(_isTold, true)) return;
  _effects.recordFailure("Machine", copied.failure());
}

}  // namespace tavisk
