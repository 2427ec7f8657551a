// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/RootedFileSystem.h"

#include "base/Text.h"
#include "effects/SettingNames.h"

namespace tavisk {
namespace {

/// As a root has it in which there is nothing, and so no link.
std::string standardizedInNothing(const std::string& path) {
  std::vector<std::string> names;
  for (auto& name : split(path, "/")) {
    if (name == "..") {
      if (!names.empty()) names.pop_back();
    } else if (name != ".") {
      names.push_back(std::move(name));
    }
  }
  std::string standardized;
  for (const auto& name : names) standardized += "/" + name;
  return standardized.empty() ? "/" : standardized;
}

}  // namespace

bool RootedFileSystem::exists(const std::string& path) {
  const auto there = _root.isThere(path);
  if (!there) tell(path, there.failure());
  return there && *there;
}

Result<std::string> RootedFileSystem::read(const std::string& path, std::size_t limit) {
  auto contents = _root.read(path, limit);
  if (!contents) tell(path, contents.failure());
  return contents;
}

Result<std::string> RootedFileSystem::readBeginning(const std::string& path, std::size_t length) {
  auto beginning = _root.readBeginning(path, length);
  if (!beginning) tell(path, beginning.failure());
  return beginning;
}

Result<std::string> RootedFileSystem::standardized(const std::string& path) {
  auto found = _root.standardized(path);
  if (found) return found;
  if (isAbsent(found.failure())) return standardizedInNothing(path);
  tell(path, found.failure());
  return found;
}

void RootedFileSystem::tell(const std::string& path, const Failure& failure) {
  if (isAbsent(failure)) return;
  const auto count = countIn(path);
  if (!count) return;
  const auto* note = count == mostTold ? "what else cannot be looked at is not told" : "";
  _effects.record({.setting = setting::files, .outcome = Outcome::failed, .note = note, .failure = failure});
}

std::optional<std::size_t> RootedFileSystem::countIn(const std::string& path) {
  const std::scoped_lock lock(_mutex);
  if (_told.size() == mostTold || !_told.insert(path).second) return std::nullopt;
  return _told.size();
}

}  // namespace tavisk
