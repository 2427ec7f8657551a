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

Result<bool> isLink(const FileDescriptor& file, const std::string& path) {
  struct stat status {};
  if (::fstat(file.number(), &status) != 0) return systemFailure("look at", path, errno);
  return S_ISLNK(status.st_mode);
}

}  // namespace

Result<std::string> targetOf(const FileDescriptor& link, const std::string& path) {
  const auto isOne = isLink(link, path);
  if (!isOne) return isOne.failure();
  if (!*isOne) return Failure{"read link", path, "not a symbolic link"};
  std::array<char, PATH_MAX> target{};
  const auto length = ::readlinkat(link.number(), "", target.data(), target.size());
  if (length < 0) return systemFailure("read link", path, errno);
  return std::string(target.data(), static_cast<std::size_t>(length));
}

Result<std::string> PathResolver::resolve(const std::string& path) {
  _path = path;
  push(path);
  auto isDone = reopenFolder();
  while (isDone && !_pending.empty()) {
    const auto name = std::move(_pending.back());
    _pending.pop_back();
    if (name != ".") isDone = name == ".." ? leave() : enter(name);
  }
  if (!isDone) return isDone.failure();
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
    const auto isOne = opened ? isLink(*opened, _path) : false;
    if (!isOne) return isOne.failure();
    if (*isOne) return follow(*opened);
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
    if (auto opened = reopenFolder(); !opened) return opened;
  }
  push(*target);
  return {};
}

Result<void> PathResolver::leave() {
  if (!_resolved.empty()) _resolved.pop_back();
  return reopenFolder();
}

Result<void> PathResolver::reopenFolder() {
  auto opened = openBeneath(_root, resolved(), O_PATH);
  if (!opened && !isAbsent(opened.failure())) return retold(opened.failure(), "resolve", _path);
  _folder = opened ? std::move(opened).value() : FileDescriptor();
  return {};
}

std::string PathResolver::resolved() const {
  std::string path;
  for (const auto& name : _resolved) path += "/" + name;
  return path.empty() ? "/" : path;
}

}  // namespace tavisk
