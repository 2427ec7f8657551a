// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "platform/FileDescriptor.h"
#include "platform/Result.h"

namespace tavisk {

/// The names in an open folder, sorted by bytes, without "." and "..". `path` is what failures name.
Result<std::vector<std::string>> namesIn(const FileDescriptor& folder, const std::string& path);

}  // namespace tavisk
