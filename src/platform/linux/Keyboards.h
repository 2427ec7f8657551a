// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "platform/Result.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// The folders in /sys of the keyboards that stand at the machine, or are plugged into it. The one that a management
/// controller pretends to be, for who sits elsewhere, is none.
std::vector<std::string> keyboards(const SystemRoot& root);

/// Whether the kernel passes on nothing of what is typed there (Documentation/input/input-programming.rst).
Result<bool> isInhibited(const SystemRoot& root, const std::string& keyboard);
Result<void> setInhibited(const SystemRoot& root, const std::string& keyboard, bool inhibited);

}  // namespace tavisk
