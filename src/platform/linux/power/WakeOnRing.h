// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/SysDevice.h"
#include "platform/linux/power/UdevRule.h"

namespace tavisk {

/// Whether a modem that rings at a serial port wakes the machine. It is the port's place on the board that can: the
/// terminal of every port has a file power/wakeup, which proves nothing.
class WakeOnRing {
 public:
  explicit WakeOnRing(const LinuxMachine& machine) : _machine(machine), _rule(machine.root, "wake-on-ring") {}

  Setting wakeOnModem() const;
  Setting wakeOnModemChange() const;

 private:
  struct Port {
    std::string terminal;
    SysDevice place;
  };
  std::vector<Port> ports() const;
  std::optional<Failure> whyNoPort() const;
  Result<std::optional<std::string>> live() const;
  Result<void> apply(const std::string& value) const;

  LinuxMachine _machine;
  UdevRule _rule;
};

}  // namespace tavisk
