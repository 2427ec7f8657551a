// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <set>

#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The files beneath a root, for either host. Of the files that cannot be looked at each is told once, and of all of
/// them the first few: volumes hold what they like. From any thread.
class RootedFileSystem final : public FileSystem {
 public:
  static constexpr std::size_t mostTold = 16;

  /// Nothing that is given is owned.
  RootedFileSystem(const SystemRoot& root, EffectSink& effects) : _root(root), _effects(effects) {}

  bool exists(const std::string& path) override;
  Result<std::string> read(const std::string& path, std::size_t limit) override;
  Result<std::string> readBeginning(const std::string& path, std::size_t length) override;
  Result<std::string> standardized(const std::string& path) override;

 private:
  void tell(const std::string& path, const Failure& failure);
  /// How many are told with this one; absent when it is not to be told.
  std::optional<std::size_t> countIn(const std::string& path);

  const SystemRoot& _root;
  EffectSink& _effects;
  std::mutex _mutex;
  std::set<std::string> _told;  ///< guarded by _mutex
};

}  // namespace tavisk
