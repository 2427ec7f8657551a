// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/Result.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// Appends a line and its newline in one piece; the file is made when it is missing. Several runs may append.
Result<void> appendLine(const SystemRoot& root, const std::string& path, std::string line);

}  // namespace tavisk
