// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/FolderNames.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "platform/SystemFailure.h"

namespace tavisk {

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
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace tavisk
