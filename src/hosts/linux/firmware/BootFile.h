// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A program that firmware can load (the Portable Executable format, "Optional Header" and "Certificate Table").
struct BootFile {
  bool isSigned = false;  ///< it carries a signature; by whom only firmware can tell
};

/// `head` is the beginning of a file; absent when it is no program for firmware.
std::optional<BootFile> parseBootFile(std::string_view head);

/// Fails when there is no such regular file, or when firmware could not start it: the reason is for people.
Result<BootFile> readBootFile(const SystemRoot& root, const std::string& path);

}  // namespace tavisk
