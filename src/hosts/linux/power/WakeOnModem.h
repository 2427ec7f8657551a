// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "hosts/linux/power/UdevRule.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SysDevice.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Whether a modem that rings at a serial port wakes the machine. It is the port's place on the board that can: the
/// terminal of every port has a file power/wakeup, which proves nothing.
class WakeOnModem {
 public:
  explicit WakeOnModem(const LinuxMachine& machine);

  /// Refers to the object.
  Setting<bool> wakeOnModem() const;

 private:
  struct Port {
    std::string terminal;
    SysDevice place;
  };
  Result<std::vector<Port>> ports() const;
  /// Absent when the terminal is no serial port that can wake the machine.
  Result<std::optional<Port>> wakingPort(const std::string& terminal) const;
  Support supported() const;
  Setting<bool>::Found live() const;
  Result<void> apply(bool wakes) const;

  LinuxMachine _machine;
  UdevRule<bool> _rule;
};

}  // namespace tavisk
