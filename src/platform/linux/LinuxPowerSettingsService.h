// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/PowerSettingsService.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/power/ConsoleBlanking.h"
#include "platform/linux/power/DiskSleep.h"
#include "platform/linux/power/FreezeRestart.h"
#include "platform/linux/power/LoginService.h"
#include "platform/linux/power/RestartPolicy.h"
#include "platform/linux/power/WakeOnNetwork.h"
#include "platform/linux/power/WakeOnRing.h"

namespace tavisk {

/// What of the machine's devices is reached otherwise than by files. All of it outlives its users.
struct PowerDevices {
  Console& console;
  NetworkCards& cards;
  ManagementController& controller;
};

/// A server has one set of power settings, whatever feeds it.
class LinuxPowerSettingsService : public PowerSettingsService {
 public:
  LinuxPowerSettingsService(const LinuxMachine& machine, const PowerDevices& devices);

  Minutes untilSleep(SleepTimer timer, const PowerSource& source) override;
  void setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) override;
  bool supports(PowerSwitch which, const PowerSource& source) override;
  bool canSet(PowerSwitch which, const PowerSource& source) override;
  bool isOn(PowerSwitch which, const PowerSource& source) override;
  void setOn(PowerSwitch which, const PowerSource& source, bool on) override;
  bool restartsOnHang() override;
  void setRestartsOnHang(bool restarts) override;

 private:
  Setting toRead(SleepTimer timer);
  Setting toChange(SleepTimer timer, const std::string& minutes);
  Setting toRead(PowerSwitch which);
  Setting toChange(PowerSwitch which);

  LinuxMachine _machine;
  LoginService _login;
  ConsoleBlanking _console;
  DiskSleep _disks;
  WakeOnNetwork _network;
  WakeOnRing _modem;
  RestartPolicy _restart;
  FreezeRestart _freeze;
};

}  // namespace tavisk
