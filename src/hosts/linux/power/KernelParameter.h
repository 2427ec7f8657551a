// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

inline constexpr const char* kernelCommandLine = "/proc/cmdline";

/// What the kernel is told at each start (Documentation/admin-guide/kernel-parameters.rst), the last one of the name:
/// "600" of "consoleblank=600"; absent when it is not told.
Result<std::optional<std::string>> kernelParameter(const SystemRoot& root, const std::string& name);

}  // namespace tavisk
