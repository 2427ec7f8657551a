// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/OpenBeneath.h"

#include <dirent.h>
#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

namespace tavisk {
namespace {

// The kernel answers EAGAIN when something was renamed or mounted while it resolved a "..".
constexpr int enoughLookups = 256;

Failure openFailure(const std::string& path, int error) {
  auto failure = systemFailure("open", path, error);
  if (error != ENOSYS) return failure;
  failure.tried = "openat2";
  failure.why = "this kernel has no such call (Linux 5.6 or later is needed)";
  return failure;
}

Result<FileDescriptor> openHow(const FileDescriptor& root, const std::string& path, open_how how) {
  how.flags |= O_CLOEXEC;
  how.resolve |= RESOLVE_IN_ROOT | RESOLVE_NO_MAGICLINKS;
  for (int tries = 0;; ++tries) {
    const auto number = static_cast<int>(::syscall(SYS_openat2, root.number(), path.c_str(), &how, sizeof how));
    if (number >= 0) return FileDescriptor(number);
    const bool isTriedAgain = (errno == EINTR || errno == EAGAIN) && tries < enoughLookups;
    if (!isTriedAgain) return openFailure(path, errno);
  }
}

}  // namespace

Result<FileDescriptor> openBeneath(const FileDescriptor& root, const std::string& path, int flags, unsigned mode) {
  open_how how{};
  how.flags = static_cast<unsigned>(flags);
  how.mode = mode;
  return openHow(root, path, how);
}

bool existsWithoutLinks(const FileDescriptor& root, const std::string& path) {
  open_how how{};
  how.flags = O_PATH;
  how.resolve = RESOLVE_NO_SYMLINKS;
  return static_cast<bool>(openHow(root, path, how));
}

Result<FileDescriptor> openNamed(const FileDescriptor& folder, const std::string& name, int flags, unsigned mode) {
  while (true) {
    const auto number = ::openat(folder.number(), name.c_str(), flags | O_CLOEXEC, mode);
    if (number >= 0) return FileDescriptor(number);
    if (errno != EINTR) return systemFailure("open", name, errno);
  }
}

Result<std::vector<std::string>> namesIn(const FileDescriptor& folder, const std::string& path) {
  auto again = openNamed(folder, ".", O_RDONLY | O_DIRECTORY);
  if (!again) return retold(again.failure(), "list", path);
  auto listed = std::move(again).value();
  const auto close = [](DIR* opened) { ::closedir(opened); };
  const std::unique_ptr<DIR, decltype(close)> stream(::fdopendir(listed.number()), close);
  if (!stream) return systemFailure("list", path, errno);
  static_cast<void>(listed.release());  // the stream closes it
  std::vector<std::string> names;
  errno = 0;
  while (const dirent* entry = ::readdir(stream.get())) {
    std::string name = entry->d_name;
    if (name != "." && name != "..") names.push_back(std::move(name));
  }
  if (errno != 0) return systemFailure("list", path, errno);
  std::ranges::sort(names);
  return names;
}

}  // namespace tavisk
