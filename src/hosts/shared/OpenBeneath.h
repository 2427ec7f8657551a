// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"

namespace tavisk {

/// open(2) of a path as if the folder `root` were the root directory; no magic links.
Result<FileDescriptor> openBeneath(const FileDescriptor& root, const std::string& path, int flags, unsigned mode = 0);

/// Whether the path exists beneath the root and has no symbolic link in it; what cannot be looked at does not.
bool existsWithoutLinks(const FileDescriptor& root, const std::string& path);

/// As openat(2), of a single name, and closed on exec.
Result<FileDescriptor> openNamed(const FileDescriptor& folder, const std::string& name, int flags, unsigned mode = 0);

/// The names in an open folder, sorted by bytes, without "." and "..". `path` is what failures name.
Result<std::vector<std::string>> namesIn(const FileDescriptor& folder, const std::string& path);

}  // namespace tavisk
