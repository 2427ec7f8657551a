// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/PathResolver.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>

#include "base/Text.h"
#include "hosts/shared/OpenBeneath.h"

namespace tavisk {
namespace {

constexpr int mostLinks = 40;  // as the kernel: path_resolution(7)

bool isLink(const FileDescriptor& file) {
  struct stat status {};
  return ::fstat(file.number(), &status) == 0 && S_ISLNK(status.st_mode);
}

}  // namespace

Result<std::string> targetOf(const FileDescriptor& link, const std::string& path) {
  if (!isLink(link)) return Failure{"read link", path, "not a symbolic link"};
  std::array<char, PATH_MAX> target{};
  const auto length = ::readlinkat(link.number(), "", target.data(), target.size());
  if (length < 0) return systemFailure("read link", path, errno);
  return std::string(target.data(), static_cast<std::size_t>(length));
}

Result<std::string> PathResolver::resolve(const std::string& path) {
  _path = path;
  reopenFolder();
  push(path);
  while (!_pending.empty()) {
    const auto name = std::move(_pending.back());
    _pending.pop_back();
    if (name == ".") continue;
    if (name == "..") {
      leave();
    } else if (const auto entered = enter(name); !entered) {
      return entered.failure();
    }
  }
  return resolved();
}

void PathResolver::push(const std::string& path) {
  const auto names = split(path, "/");
  _pending.insert(_pending.end(), names.rbegin(), names.rend());
}

Result<void> PathResolver::enter(const std::string& name) {
  FileDescriptor file;
  if (_folder) {
    auto opened = openNamed(_folder, name, O_PATH | O_NOFOLLOW);
    if (!opened && !isAbsent(opened.failure())) return retold(opened.failure(), "resolve", _path);
    if (opened && isLink(*opened)) return follow(*opened);
    if (opened) file = std::move(opened).value();
  }
  _resolved.push_back(name);
  _folder = std::move(file);
  return {};
}

Result<void> PathResolver::follow(const FileDescriptor& link) {
  if (++_links > mostLinks) return systemFailure("resolve", _path, ELOOP);
  const auto target = targetOf(link, _path);
  if (!target) return target.failure();
  if (target->starts_with('/')) {
    _resolved.clear();
    reopenFolder();
  }
  push(*target);
  return {};
}

void PathResolver::leave() {
  if (!_resolved.empty()) _resolved.pop_back();
  reopenFolder();
}

void PathResolver::reopenFolder() {
  auto opened = openBeneath(_root, resolved(), O_PATH);
  _folder = opened ? std::move(opened).value() : FileDescriptor();
}

std::string PathResolver::resolved() const {
  std::string path;
  for (const auto& name : _resolved) path += "/" + name;
  return path.empty() ? "/" : path;
}

}  // namespace tavisk
