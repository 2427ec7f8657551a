// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// One of the files that the tool writes for itself alone (OwnFiles.h).
class OwnFile {
 public:
  /// The root must outlive the object.
  OwnFile(const SystemRoot& root, std::string path) : _root(root), _path(std::move(path)) {}

  const std::string& path() const { return _path; }
  /// Empty when there is no such file.
  Result<std::string> text() const;
  /// Puts these lines in place of the old ones. A file that cannot be read stays as it is.
  Result<void> replace(const std::string& lines) const;

 private:
  const SystemRoot& _root;
  std::string _path;
};

}  // namespace tavisk
