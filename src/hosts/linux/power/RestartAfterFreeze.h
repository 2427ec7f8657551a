// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/KernelPanic.h"
#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Whether a machine that hangs restarts: the service manager keeps the watchdog's clock from running out
/// (RuntimeWatchdogSec of systemd-system.conf(5)), and a kernel that has panicked restarts (kernel.panic). The parts
/// may differ; the detail then says which one is on. An administrator's own kernel.panic stays as it is, on or off, and
/// a watchdog that is in use already keeps its time.
class RestartAfterFreeze {
 public:
  explicit RestartAfterFreeze(const LinuxMachine& machine)
      : _machine(machine),
        _config(machine.root, "system.conf"),
        _watchdogFile(machine.root, _config.ownDropIn()),
        _panic(machine) {}

  /// Refers to the object.
  Setting<bool> restartAfterFreeze() const;

 private:
  Result<bool> hasWatchdog() const;
  Support supported() const;
  Setting<bool>::Found live() const;
  /// What the service manager means to do; whether the watchdog runs is a fact of its own.
  Result<bool> isWatchdogUsed() const;
  /// Whether the kernel says so of the watchdog; it need not tell.
  Result<bool> isWatchdog(const char* fact, const char* word) const;
  Setting<bool>::Found stored() const;
  Result<bool> isWatchdogStored() const;
  /// Absent when the tool's own drop-in does not say.
  Result<std::optional<bool>> isWatchdogInOwn() const;

  Result<void> check(bool restarts) const;
  Result<void> checkWatchdog(bool restarts) const;
  /// Whether both are as asked and nothing of it has to be written.
  Result<bool> isWatchdogKept(bool restarts) const;
  /// Why the watchdog cannot be turned off now.
  Result<void> checkWatchdogStops() const;
  /// The places that were written are added.
  Result<void> store(bool restarts, WrittenPlaces& written) const;
  Result<void> storeWatchdog(bool restarts) const;
  Result<void> apply(bool restarts) const;
  Result<bool> hasOwn() const;
  Result<void> takeOwnAway(WrittenPlaces& taken) const;
  Result<void> applyStored() const;
  Result<void> turnWatchdogOn() const;
  Result<void> turnWatchdogOff() const;
  Result<void> setWatchdogTime(std::chrono::microseconds time) const;
  std::string whatHidesWatchdog(bool restarts) const;
  std::string whatUndoes(bool restarts) const;

  LinuxMachine _machine;
  SystemdConfig _config;
  OwnFile _watchdogFile;
  KernelPanic _panic;
};

}  // namespace tavisk
