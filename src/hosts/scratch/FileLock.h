// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <string>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Locks a file against other runs (flock(2)) until the descriptor is closed; it is made when it is missing, its folder
/// is not. Fails when another run keeps it locked for longer than `patience`.
Result<FileDescriptor> lockFile(const SystemRoot& root, const std::string& path, std::chrono::milliseconds patience);

}  // namespace tavisk
