// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/OpenBeneath.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>

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

}  // namespace tavisk
