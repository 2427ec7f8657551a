// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "hosts/scratch/ScratchDisks.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// How the effects of a rehearsal tell it.
std::string textOf(const BootSettings::BootChoice& choice);

/// "Disks" and "Firmware".
class ScratchDiskManagement final : public DiskManagementService {
 public:
  ScratchDiskManagement(MachineFile& machine, MachineSettings& settings, ScratchDisks& disks)
      : _machine(machine), _settings(settings), _disks(disks) {}

  bool is(DiskTrait trait, const DiskName& disk) override;
  std::string protocolOf(const DiskName& disk) override;
  std::string nameOf(DiskProtocol protocol) override;
  int partitionScheme(const DiskName& disk) override;
  OpticalBootability opticalBootability(const DiskName& disk) override;

  int preBootEnvironment() override;
  LegacyBootSupport legacyBootSupport() override;
  BootPreference bootPreference() override;
  NetworkBootPreference networkBootPreference() override;
  ServiceStatus setBootPreference(const BootChoice& choice) override;
  ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) override;

 private:
  /// Makes the change unless the firmware answers it with the status under the key.
  template <typename Value>
  ServiceStatus change(const MachineSetting<Value>& setting, const Value& asked, const char* statusKey);

  MachineFile& _machine;
  MachineSettings& _settings;
  ScratchDisks& _disks;
};

}  // namespace tavisk
