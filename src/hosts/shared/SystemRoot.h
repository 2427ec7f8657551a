// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"

namespace tavisk {

/// Tells two versions of a file apart: another inode, size or time means that the file was written since.
struct FileStamp {
  std::uint64_t device;
  std::uint64_t inode;
  std::int64_t size;
  std::int64_t modified;  ///< nanoseconds
  std::int64_t changed;   ///< nanoseconds
  bool operator==(const FileStamp&) const = default;
};

/// The files beneath one folder, the prefix, as if it were the root of the machine. Paths, also those in failures, are
/// the machine's and absolute. Symbolic links are followed inside the prefix, an absolute target starts at the prefix,
/// and neither a link nor ".." leads out of it; the links of /proc that name open files are not followed (openat2(2),
/// Linux 5.6).
class SystemRoot {
 public:
  /// "/", or an absolute path; it need not exist until something beneath it is asked for.
  explicit SystemRoot(std::string prefix) : _prefix(std::move(prefix)) {}
  const std::string& prefix() const { return _prefix; }

  /// `flags` and `mode` are those of open(2); the descriptor is closed on exec.
  Result<FileDescriptor> open(const std::string& path, int flags, unsigned mode = 0) const;
  /// Whether something is at the path; a link that leads nowhere is nothing. Absent is what isAbsent() says: whatever
  /// else keeps it from being looked at is a failure.
  Result<bool> isThere(const std::string& path) const;
  /// Those of the paths where something is, in their order; none of them is in /proc.
  Result<std::vector<std::string>> thoseThere(std::vector<std::string> paths) const;
  /// Absent when there is no such file or it cannot be looked at. Links among the folders of the path are followed out
  /// of the prefix too: this only tells whether to read again, and is asked often.
  std::optional<FileStamp> stamp(const std::string& path) const;
  /// A regular file, to be read. Nothing else is opened: no FIFO, no device, no socket.
  Result<FileDescriptor> openRegular(const std::string& path) const;
  /// Such a file of at most `limit` bytes.
  Result<std::string> read(const std::string& path, std::size_t limit) const;
  /// The first `length` bytes of such a file, however large it is, or all where it has no more.
  Result<std::string> readBeginning(const std::string& path, std::size_t length) const;
  Result<std::string> readLink(const std::string& path) const;
  /// The names in a folder, sorted by bytes, without "." and "..".
  Result<std::vector<std::string>> list(const std::string& path) const;
  /// The path without redundant separators, "." and "..", and with its symbolic links resolved as far as they exist.
  Result<std::string> standardized(const std::string& path) const;

  /// Replaces a file, or makes it and the folders above it. Whoever reads, and whoever starts after a kill or a power
  /// cut, finds the old or the new contents whole; a success is on the disk. Owner, mode and security label of the old
  /// file are kept, a new one has `modeWhenNew` whatever the umask. Where a file is mounted on the path it is rewritten
  /// in place, and put back when that fails. Temporary files that a killed run left in the folder are removed.
  Result<void> write(const std::string& path, std::string_view contents, unsigned modeWhenNew = 0644) const;
  /// Puts a symbolic link at the path, in one step where a file or a link is there.
  Result<void> writeLink(const std::string& path, const std::string& target) const;
  /// Removes a file or a link; nothing there is a success.
  Result<void> remove(const std::string& path) const;
  /// Makes the folder and those above it, the prefix included, with mode 0755 whatever the umask.
  Result<void> makeFolders(const std::string& path) const;

 private:
  Result<FileDescriptor> openPrefix(const std::string& path) const;
  Result<FileDescriptor> makeFolder(const std::string& path) const;
  Result<void> makePrefix(const std::string& path) const;

  std::string _prefix;
};

}  // namespace tavisk
