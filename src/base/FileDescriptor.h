// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

#include "base/Result.h"

namespace tavisk {

/// Owns an open file descriptor, or none.
class FileDescriptor final {
 public:
  FileDescriptor() = default;
  explicit FileDescriptor(int number) : _number(number) {}
  FileDescriptor(FileDescriptor&& other) noexcept : _number(other.release()) {}
  FileDescriptor& operator=(FileDescriptor&& other) noexcept;
  FileDescriptor(const FileDescriptor&) = delete;
  FileDescriptor& operator=(const FileDescriptor&) = delete;
  ~FileDescriptor();

  explicit operator bool() const { return _number >= 0; }
  int number() const { return _number; }
  /// Gives it away: whoever takes it closes it.
  int release() { return std::exchange(_number, -1); }

 private:
  int _number = -1;
};

/// Everything from the descriptor's place to the end, at most `limit` bytes. `path` is what failures name.
Result<std::string> readAll(const FileDescriptor& file, std::size_t limit, const std::string& path);

/// The first bytes from the descriptor's place, at most `length`.
Result<std::string> readBeginning(const FileDescriptor& file, std::size_t length, const std::string& path);

/// So many bytes from a place of the file, or those that it has there; the descriptor's own place does not count.
Result<std::string> readAt(const FileDescriptor& file, std::uint64_t place, std::size_t length,
                           const std::string& path);

/// Every byte, however many calls it takes.
Result<void> writeAll(const FileDescriptor& file, std::string_view contents, const std::string& path);

/// A line with its newline, whole or not at all: the part of it that found room in a regular file is taken back. Where
/// that cannot be (a pipe, or others have written meanwhile) the part is made a line of its own, if it can be, so that
/// the next line is whole. Runs that append to the same file wait for each other, but not for long.
Result<void> appendLine(const FileDescriptor& file, std::string_view line, const std::string& path);

}  // namespace tavisk
