// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/systems/LinuxSystems.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The files of the machine, and beside them those by which its Linux systems are shown. Real files go first. From any
/// thread.
class SystemFiles final : public FileSystem {
 public:
  /// Neither is owned.
  SystemFiles(FileSystem& real, const LinuxSystems& systems) : _real(real), _systems(systems) {}

  bool exists(const std::string& path) override;
  Result<std::string> read(const std::string& path, std::size_t limit) override;
  Result<std::string> readBeginning(const std::string& path, std::size_t length) override;
  Result<std::string> standardized(const std::string& path) override;

 private:
  std::optional<std::string> contents(const std::string& path) const { return _systems.shown()->contents(path); }

  FileSystem& _real;
  const LinuxSystems& _systems;
};

}  // namespace tavisk
