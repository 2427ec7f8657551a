// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// "Power Sources" and "Power".
class ScratchPowerSettingsService final : public PowerSettingsService {
 public:
  explicit ScratchPowerSettingsService(MachineSettings& settings) : _settings(settings) {}

  Minutes untilSleep(SleepTimer timer, const PowerSource& source) override;
  void setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) override;

  bool supports(PowerSwitch which, const PowerSource& source) override;
  bool canSet(PowerSwitch which, const PowerSource& source) override;
  bool isOn(PowerSwitch which, const PowerSource& source) override;
  void setOn(PowerSwitch which, const PowerSource& source, bool on) override;
  bool restartsAfterFreeze() override;
  void setRestartsAfterFreeze(bool restarts) override;

  /// Takes the keys out of the machine file: those of mains; see ResetService. A switch that the machine
  /// has stays, and is off.
  void reset(SleepTimer timer);
  void reset(PowerSwitch which);
  void resetRestartAfterFreeze();

 private:
  bool has(PowerSwitch which, const PowerSource& source);

  MachineSettings& _settings;
};

}  // namespace tavisk
