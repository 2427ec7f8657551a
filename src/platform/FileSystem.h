// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string>

#include "base/PropertyList.h"
#include "base/Result.h"

namespace tavisk {

/// The files of the machine. Paths are the machine's, absolute; links are followed inside the machine's root and never
/// out of it. What is read is a regular file, never a FIFO, a device or a socket.
class FileSystem {
 public:
  virtual ~FileSystem() = default;

  virtual bool exists(const std::string& path) = 0;
  /// At most `limit` bytes; a larger file is a failure.
  virtual Result<std::string> read(const std::string& path, std::size_t limit) = 0;
  /// The path without redundant separators, "." and "..", and with its symbolic links resolved as far as they exist.
  virtual Result<std::string> standardized(const std::string& path) = 0;
};

}  // namespace tavisk
