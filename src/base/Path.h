// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// What stands behind the last "/": "sda" of "/sys/block/sda"; all of a text that has none.
std::string baseName(const std::string& path);

/// "/Volumes" of "/Volumes/A", "/" of "/Volumes" and of "/" itself. `path` is absolute.
/// For names to be appended after a slash: empty for what is at the top.
std::string folderOf(const std::string& path);

/// "/" for what is at the top.
std::string parentFolder(const std::string& path);

}  // namespace tavisk
