// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/KernelFile.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>

#include "base/FileDescriptor.h"

namespace tavisk {

Result<std::string> readKernelFile(const SystemRoot& root, const std::string& path) {
  constexpr std::size_t limit = 4096;
  auto text = root.read(path, limit);
  if (!text) return text;
  return text->substr(0, text->find_last_not_of(std::string_view(" \t\n\0", 4)) + 1);
}

bool isGone(const Failure& failure) {
  constexpr int errors[] = {ENODEV, ENXIO, ENOMEDIUM};
  const auto is = [&](int error) { return failure.code == std::error_code(error, std::generic_category()); };
  return isAbsent(failure) || std::ranges::any_of(errors, is);
}

Result<void> writeKernelFile(const SystemRoot& root, const std::string& path, std::string_view text) {
  const auto file = root.open(path, O_WRONLY | O_TRUNC | O_NOCTTY | O_NONBLOCK);
  if (!file) return file.failure();
  return writeAll(*file, text, path);
}

}  // namespace tavisk
