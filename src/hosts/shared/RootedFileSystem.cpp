// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/RootedFileSystem.h"

#include "base/Text.h"

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

/// What was looked at, after it was told what else but absence kept it from that.
template <typename Value>
Result<Value> RootedFileSystem::told(Result<Value> looked) {
  if (!looked && !isAbsent(looked.failure())) _looks.tell(looked.failure());
  return looked;
}

bool RootedFileSystem::exists(const std::string& path) {
  return told(_root.isThere(path)).valueOr(false);
}

Result<std::string> RootedFileSystem::read(const std::string& path, std::size_t limit) {
  return told(_root.read(path, limit));
}

Result<std::string> RootedFileSystem::readBeginning(const std::string& path, std::size_t length) {
  return told(_root.readBeginning(path, length));
}

Result<std::string> RootedFileSystem::standardized(const std::string& path) {
  auto found = told(_root.standardized(path));
  if (!found && isAbsent(found.failure())) return standardizedInNothing(path);
  return found;
}

}  // namespace tavisk
