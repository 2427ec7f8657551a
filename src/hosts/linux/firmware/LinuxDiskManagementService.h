// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/disks/LinuxDiskQueries.h"
#include "hosts/linux/firmware/LinuxBootSettings.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// The questions about disks and the settings of the firmware, under one name.
class LinuxDiskManagementService final : public DiskManagementService {
 public:
  LinuxDiskManagementService(const LinuxMachine& machine, LinuxDisks& disks) : _queries(disks), _boot(machine, disks) {}

  bool is(DiskTrait trait, const DiskName& disk) override { return _queries.is(trait, disk); }
  std::string protocolOf(const DiskName& disk) override { return _queries.protocolOf(disk); }
  std::string nameOf(DiskProtocol protocol) override { return _queries.nameOf(protocol); }
  int partitionScheme(const DiskName& disk) override { return _queries.partitionScheme(disk); }
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
  LinuxDiskQueries _queries;
  LinuxBootSettings _boot;
};

}  // namespace tavisk
