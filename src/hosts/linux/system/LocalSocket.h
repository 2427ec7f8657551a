// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Connects to a socket in the file system (unix(7)); `type` is SOCK_STREAM or SOCK_DGRAM. The path may be longer than
/// a socket address holds.
Result<FileDescriptor> connectLocalSocket(const SystemRoot& root, const std::string& path, int type);

}  // namespace tavisk
