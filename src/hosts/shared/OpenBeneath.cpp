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

#include "base/Result.h"

namespace tavisk {
namespace {

FileDescriptor openHow(const FileDescriptor& root, const std::string& path, open_how how) {
  how.flags |= O_CLOEXEC;
  how.resolve |= RESOLVE_IN_ROOT | RESOLVE_NO_MAGICLINKS;
  // The kernel answers EAGAIN when something was renamed or mounted while it resolved a "..".
  constexpr int enoughTries = 256;
  for (int tries = 0;; ++tries) {
    auto number = static_cast<int>(::syscall(SYS_openat2, root.number(), path.c_str(), &how, sizeof how));
    bool again = number < 0 && (errno == EINTR || errno == EAGAIN);
    if (!again || tries == enoughTries) return FileDescriptor(number);
  }
}

}  // namespace

FileDescriptor openBeneath(const FileDescriptor& root, const std::string& path, int flags, unsigned mode) {
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

FileDescriptor openNamed(const FileDescriptor& folder, const std::string& name, int flags, unsigned mode) {
  int number;
  do number = ::openat(folder.number(), name.c_str(), flags | O_CLOEXEC, mode);
  while (number < 0 && errno == EINTR);
  return FileDescriptor(number);
}

Result<std::vector<std::string>> namesIn(const FileDescriptor& folder, const std::string& path) {
  int number = ::openat(folder.number(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  if (number < 0) return systemFailure("list", path, errno);
  auto close = [](DIR* opened) { ::closedir(opened); };
  std::unique_ptr<DIR, decltype(close)> stream(::fdopendir(number), close);
  if (!stream) {
    int error = errno;
    ::close(number);
    return systemFailure("list", path, error);
  }
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
