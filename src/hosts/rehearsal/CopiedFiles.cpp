// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/CopiedFiles.h"

#include <filesystem>
#include <utility>

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
  if (!leadsTo || !_files.exists(*leadsTo)) return leadsTo;
  const std::scoped_lock lock(_mutex);
  const auto way = copyWayTo(path);
  tell(way ? _copy.makeFolders(*way) : Result<void>(way.failure()));
  return leadsTo;
}

/// The path without the links that lead to it, which the copy has then.
Result<std::string> CopiedFiles::copyWayTo(const std::string& path) {
  std::filesystem::path reached = "/";
  for (const auto& part : std::filesystem::path(path).relative_path()) {
    const auto here = reached / part;
    const auto leadsTo = _files.standardized(here.string());
    if (!leadsTo) return leadsTo.failure();
    const bool isLink = *leadsTo != here && part != "." && part != ".." && !part.empty();
    if (isLink)
      if (const auto linked = _copy.writeLink(here.string(), *leadsTo); !linked) return linked.failure();
    reached = *leadsTo;
  }
  return reached.string();
}

/// What is known already of a file is not replaced by less.
void CopiedFiles::copyFile(const std::string& path, const std::string& contents) {
  const std::scoped_lock lock(_mutex);
  const auto way = copyWayTo(path);
  if (!way) return tell(way.failure());
  const auto isThere = _copy.isThere(*way);
  if (!isThere) return tell(isThere.failure());
  if (!*isThere || !contents.empty()) tell(_copy.write(*way, contents));
}

void CopiedFiles::tell(const Result<void>& copied) {
  if (copied || std::exchange(_isTold, true)) return;
  _effects.recordFailure("Machine", copied.failure());
}

}  // namespace tavisk
