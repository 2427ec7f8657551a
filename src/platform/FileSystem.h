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
/// out of it. What is read is a regular file, never a FIFO, a device or a socket. Whatever but absence keeps a file
/// from being looked at is told to the effects too, within bounds: most callers can only go on without the file.
class FileSystem {
 public:
  virtual ~FileSystem() = default;

  /// False also for what cannot be looked at.
  virtual bool exists(const std::string& path) = 0;
  /// At most `limit` bytes; a larger file is a failure.
  virtual Result<std::string> read(const std::string& path, std::size_t limit) = 0;
  /// The first `length` bytes of a file of any size, or all where it has no more.
  virtual Result<std::string> readBeginning(const std::string& path, std::size_t length) = 0;
  /// The path without redundant separators, "." and "..", and with its symbolic links resolved as far as they exist.
  virtual Result<std::string> standardized(const std::string& path) = 0;
};

}  // namespace tavisk
