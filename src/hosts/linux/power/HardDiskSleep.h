// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "hosts/linux/power/UdevRule.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SysDevice.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// After how many idle minutes the kernel stops the motors of built-in disks (runtime power management of SCSI and ATA
/// disks: Documentation/ABI/testing/sysfs-devices-power).
class HardDiskSleep {
 public:
  explicit HardDiskSleep(const LinuxMachine& machine) : _machine(machine), _rule(machine.root, "disk-sleep") {}

  Setting<std::string> hardDiskSleep() const;
  Setting<std::string> hardDiskSleepChange() const;

 private:
  struct Disk {
    std::string name;
    SysDevice device;
  };
  std::vector<Disk> disks() const;
  bool canStop(const SysDevice& disk) const;
  std::optional<Failure> whyNoDisk() const;
  Result<std::optional<std::string>> live() const;
  Result<void> apply(const std::string& minutes) const;

  LinuxMachine _machine;
  UdevRule _rule;
};

}  // namespace tavisk
