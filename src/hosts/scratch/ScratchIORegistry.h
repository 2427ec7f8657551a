// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "platform/IORegistry.h"

namespace tavisk {

/// "Device Tree" and "Interfaces" of "Registry".
class ScratchIORegistry final : public IORegistry {
 public:
  explicit ScratchIORegistry(MachineFile& machine) : _machine(machine) {}

  RegistryStatus masterPort() override;
  std::optional<RegistryEntry> entryAtPath(const std::string& path) override;
  std::optional<Data> dataProperty(const RegistryEntry& entry, const std::string& property) override;
  std::optional<RegistryEntry> serviceNamed(const std::string& bsdName) override;
  std::pair<RegistryStatus, RegistryEntry> parent(const RegistryEntry& entry, RegistryPlane plane) override;
  std::pair<RegistryStatus, std::string> path(const RegistryEntry& entry, RegistryPlane plane) override;

 private:
  MachineSection interface(const RegistryEntry& entry);

  MachineFile& _machine;
};

}  // namespace tavisk
