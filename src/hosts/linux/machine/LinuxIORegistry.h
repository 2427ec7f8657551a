// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/shared/FailedLooks.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/IORegistry.h"

namespace tavisk {

/// The kernel's devices: an entry is a folder of sysfs, and goes by its path. What the firmware tells of the machine
/// itself, beneath "IODeviceTree:/", is there on machines with a device tree alone.
class LinuxIORegistry final : public IORegistry {
 public:
  /// Neither is owned.
  LinuxIORegistry(const SystemRoot& root, FailedLooks& looks) : _root(root), _looks(looks) {}

  RegistryStatus masterPort() override { return 0; }
  std::optional<RegistryEntry> entryAtPath(const std::string& path) override;
  std::optional<Data> dataProperty(const RegistryEntry& entry, const std::string& property) override;
  std::optional<RegistryEntry> serviceNamed(const std::string& bsdName) override;
  /// The next device above in both planes; at the top the folder of all devices.
  std::pair<RegistryStatus, RegistryEntry> parent(const RegistryEntry& entry, RegistryPlane plane) override;
  std::pair<RegistryStatus, std::string> path(const RegistryEntry& entry, RegistryPlane plane) override;

 private:
  bool isDevice(const std::string& folder);

  const SystemRoot& _root;
  FailedLooks& _looks;
};

}  // namespace tavisk
