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
  explicit HardDiskSleep(const LinuxMachine& machine);

  /// Refers to the object.
  Setting<Minutes> hardDiskSleep() const;

 private:
  struct Disk {
    std::string name;
    SysDevice device;
  };
  Result<std::vector<Disk>> disks() const;
  /// Absent when the kernel cannot stop its motor, or it has none.
  Result<std::optional<Disk>> stoppableDisk(const std::string& name) const;
  Support supported() const;
  Setting<Minutes>::Found live() const;
  Result<void> apply(Minutes asked) const;
  std::string whatUndoes() const;

  LinuxMachine _machine;
  UdevRule<Minutes> _rule;
};

}  // namespace tavisk
