// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/LogFile.h"

#include <fcntl.h>

#include "platform/FileContents.h"

namespace tavisk {

Result<void> appendLine(const SystemRoot& root, const std::string& path, std::string line) {
  auto file = root.open(path, O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file.failure();
  return writeAll(*file, line + "\n", path);
}

}  // namespace tavisk
