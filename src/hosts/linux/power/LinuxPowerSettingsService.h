// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/ComputerSleep.h"
#include "hosts/linux/power/DisplaySleep.h"
#include "hosts/linux/power/HardDiskSleep.h"
#include "hosts/linux/power/RestartAfterFreeze.h"
#include "hosts/linux/power/RestartAfterPowerFailure.h"
#include "hosts/linux/power/WakeOnModem.h"
#include "hosts/linux/power/WakeOnNetworkAccess.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// What of the machine's devices is reached otherwise than by files. All of it outlives its users.
struct PowerDevices {
  Console& console;
  NetworkCards& cards;
  ManagementController& controller;
};

/// A server has one set of power settings, whatever feeds it.
class LinuxPowerSettingsService final : public PowerSettingsService {
 public:
  LinuxPowerSettingsService(const LinuxMachine& machine, const PowerDevices& devices);

  Minutes untilSleep(SleepTimer timer, const PowerSource& source) override;
  void setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) override;
  bool supports(PowerSwitch which, const PowerSource& source) override;
  bool canSet(PowerSwitch which, const PowerSource& source) override;
  bool isOn(PowerSwitch which, const PowerSource& source) override;
  void setOn(PowerSwitch which, const PowerSource& source, bool on) override;
  bool restartsAfterFreeze() override;
  void setRestartsAfterFreeze(bool restarts) override;

  /// Takes the tool's own files away; see ResetService.
  void reset(SleepTimer timer);
  void reset(PowerSwitch which);
  void resetRestartAfterFreeze();

 private:
  Setting<Minutes> settingOf(SleepTimer timer);
  Setting<bool> settingOf(PowerSwitch which);

  LinuxMachine _machine;
  ComputerSleep _computerSleep;
  DisplaySleep _displaySleep;
  HardDiskSleep _hardDiskSleep;
  WakeOnNetworkAccess _wakeOnNetworkAccess;
  WakeOnModem _wakeOnModem;
  RestartAfterPowerFailure _restartAfterPowerFailure;
  RestartAfterFreeze _restartAfterFreeze;
};

}  // namespace tavisk
