// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/disks/LinuxDiskQueries.h"
#include "hosts/linux/systems/LinuxBootSettings.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// The questions about disks and the settings of the firmware, under one name.
class LinuxDiskManagementService final : public DiskManagementService {
 public:
  /// Nothing that is given is owned.
  LinuxDiskManagementService(const LinuxMachine& machine, LinuxDisks& disks, LinuxSystems& systems)
      : _disks(disks), _queries(disks), _boot(machine, disks, systems) {}

  bool is(DiskTrait trait, const DiskName& disk) override { return _queries.is(trait, disk); }
  std::string protocolOf(const DiskName& disk) override { return _queries.protocolOf(disk); }
  std::string nameOf(DiskProtocol protocol) override { return _queries.nameOf(protocol); }
  /// Firmware that knows no partition table starts a loader from any, which is told as another code.
  int partitionScheme(const DiskName& disk) override {
    const auto code = _queries.partitionScheme(disk);
    const bool isStartedByLoader =
        code == partitionmap::gpt && preBootEnvironment() == preboot::noneKnown && _disks.hasShown(disk);
    return isStartedByLoader ? LinuxDiskQueries::masterBootRecord : code;
  }
  OpticalBootability opticalBootability(const DiskName& disk) override { return _queries.opticalBootability(disk); }

  int preBootEnvironment() override { return _boot.preBootEnvironment(); }
  LegacyBootSupport legacyBootSupport() override { return _boot.legacyBootSupport(); }
  BootPreference bootPreference() override { return _boot.bootPreference(); }
  NetworkBootPreference networkBootPreference() override { return _boot.networkBootPreference(); }
  ServiceStatus setBootPreference(const BootChoice& choice) override { return _boot.setBootPreference(choice); }
  ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) override {
    return _boot.setFirmwareVariable(name, value);
  }

 private:
  LinuxDisks& _disks;
  LinuxDiskQueries _queries;
  LinuxBootSettings _boot;
};

}  // namespace tavisk
