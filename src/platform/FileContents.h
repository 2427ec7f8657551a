// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "platform/FileDescriptor.h"
#include "platform/Result.h"

namespace tavisk {

/// Everything from the descriptor's place to the end, at most `limit` bytes. `path` is what failures name.
Result<std::string> readAll(const FileDescriptor& file, std::size_t limit, const std::string& path);

/// Every byte, however many calls it takes.
Result<void> writeAll(const FileDescriptor& file, std::string_view contents, const std::string& path);

}  // namespace tavisk
