// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"

namespace tavisk {

/// Follows one path beneath a root folder, component by component. What does not exist stays as it is written.
class PathResolver {
 public:
  /// `root` must outlive the resolver.
  explicit PathResolver(const FileDescriptor& root) : _root(root) {}
  Result<std::string> resolve(const std::string& path);

 private:
  void push(const std::string& path);
  Result<void> enter(const std::string& name);
  Result<void> follow(const FileDescriptor& link);
  Result<void> leave();
  Result<void> reopenFolder();
  std::string resolved() const;

  const FileDescriptor& _root;
  std::string _path;                   ///< as asked, for failures
  std::vector<std::string> _pending;   ///< components to come, the next one last
  std::vector<std::string> _resolved;  ///< components so far
  FileDescriptor _folder;              ///< what `_resolved` names; empty when that does not exist
  int _links = 0;
};

/// The target of a symbolic link that was opened with O_PATH and O_NOFOLLOW.
Result<std::string> targetOf(const FileDescriptor& link, const std::string& path);

}  // namespace tavisk
