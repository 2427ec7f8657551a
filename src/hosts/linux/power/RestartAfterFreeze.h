// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Whether a machine that hangs restarts: the service manager keeps the watchdog's clock from running out
/// (RuntimeWatchdogSec of systemd-system.conf(5)), and a kernel that has panicked restarts (kernel.panic). The parts
/// may differ; the detail then says which one is on.
class RestartAfterFreeze {
 public:
  explicit RestartAfterFreeze(const LinuxMachine& machine)
      : _machine(machine), _config(machine.root, "system.conf"), _panicFile(machine.root, ownfile::kernelPanic) {}

  /// Refers to the object.
  Setting<bool> restartAfterFreeze() const;

 private:
  Result<bool> hasWatchdog() const;
  Setting<bool>::Found live() const;
  /// What the service manager means to do; whether the watchdog runs is a fact of its own.
  Result<bool> isWatchdogUsed() const;
  /// Whether the kernel says so of the watchdog; it need not tell.
  Result<bool> isWatchdog(const char* fact, const char* word) const;
  Setting<bool>::Found stored() const;
  Result<void> store(bool restarts) const;
  Result<void> apply(bool restarts) const;
  Result<void> turnWatchdogOff() const;
  Result<void> setWatchdogTime(std::chrono::microseconds time) const;
  Result<bool> isPanicStored() const;

  LinuxMachine _machine;
  SystemdConfig _config;
  OwnFile _panicFile;
};

}  // namespace tavisk
