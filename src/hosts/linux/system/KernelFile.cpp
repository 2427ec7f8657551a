// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/KernelFile.h"

#include <fcntl.h>

#include "base/FileDescriptor.h"

namespace tavisk {

Result<std::string> readKernelFile(const SystemRoot& root, const std::string& path) {
  constexpr std::size_t limit = 4096;
  auto text = root.read(path, limit);
  if (!text) return text;
  return text->substr(0, text->find_last_not_of(std::string_view(" \t\n\0", 4)) + 1);
}

Result<void> writeKernelFile(const SystemRoot& root, const std::string& path, std::string_view text) {
  const auto file = root.open(path, O_WRONLY | O_TRUNC | O_NOCTTY | O_NONBLOCK);
  if (!file) return file.failure();
  return writeAll(*file, text, path);
}

}  // namespace tavisk
