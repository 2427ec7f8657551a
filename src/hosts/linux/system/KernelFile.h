// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The text of a file of /proc or /sys, without the white space and the NUL bytes at its end.
Result<std::string> readKernelFile(const SystemRoot& root, const std::string& path);

/// Writes into a file of /proc or /sys, or into a device. It has to be there, and is never replaced.
Result<void> writeKernelFile(const SystemRoot& root, const std::string& path, std::string_view text);

}  // namespace tavisk
