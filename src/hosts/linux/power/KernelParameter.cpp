// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/KernelParameter.h"

#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {

Result<std::optional<std::string>> kernelParameter(const SystemRoot& root, const std::string& name) {
  const auto line = orEmpty(readKernelFile(root, kernelCommandLine));
  if (!line) return line.failure();
  std::optional<std::string> value;
  for (const auto& word : split(*line, " \t\n"))
    if (word.starts_with(name + "=")) value = word.substr(name.size() + 1);
  return value;
}

}  // namespace tavisk
