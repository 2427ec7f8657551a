// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/shared/SystemRoot.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The files beneath a root, for either host.
class RootedFileSystem final : public FileSystem {
 public:
  explicit RootedFileSystem(const SystemRoot& root) : _root(root) {}

  bool exists(const std::string& path) override { return _root.exists(path); }
  Result<std::string> read(const std::string& path, std::size_t limit) override { return _root.read(path, limit); }
  Result<std::string> standardized(const std::string& path) override { return _root.standardized(path); }

 private:
  const SystemRoot& _root;
};

}  // namespace tavisk
