// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "effects/SettingNames.h"
#include "hosts/shared/FailedLooks.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The files beneath a root, for either host. From any thread.
class RootedFileSystem final : public FileSystem {
 public:
  /// Nothing that is given is owned.
  RootedFileSystem(const SystemRoot& root, EffectSink& effects) : _root(root), _looks(effects, setting::files) {}

  bool exists(const std::string& path) override;
  Result<std::string> read(const std::string& path, std::size_t limit) override;
  Result<std::string> readBeginning(const std::string& path, std::size_t length) override;
  Result<std::string> standardized(const std::string& path) override;

 private:
  template <typename Value>
  Result<Value> told(Result<Value> looked);

  const SystemRoot& _root;
  FailedLooks _looks;
};

}  // namespace tavisk
