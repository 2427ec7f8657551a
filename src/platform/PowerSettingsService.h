// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <compare>
#include <cstdint>
#include <string>

namespace tavisk {

/// What feeds the machine, by name ("AC Power"); each source has settings of its own.
struct PowerSource {
  std::string name;
};

struct Minutes {
  unsigned long count = 0;  ///< 0 is never

  /// What is begun counts as a whole one, so that only no time at all is never; so is one below 0.
  template <typename Period>
  static Minutes covering(std::chrono::duration<std::int64_t, Period> time) {
    const auto minutes = std::chrono::ceil<std::chrono::minutes>(time).count();
    return {static_cast<unsigned long>(std::max<std::int64_t>(minutes, 0))};
  }

  bool isNever() const { return count == 0; }
  std::chrono::minutes duration() const { return std::chrono::minutes(count); }
  auto operator<=>(const Minutes&) const = default;  // NOLINT(modernize-use-nullptr): the compiler's own 0
};

std::string textOf(Minutes minutes);

enum class SleepTimer { computer, display, hardDisk };

/// How long the machine, its display or its disks are idle before they sleep.
class SleepTimersService {
 public:
  virtual ~SleepTimersService() = default;

  virtual Minutes untilSleep(SleepTimer timer, const PowerSource& source) = 0;
  /// The result goes to the effects.
  virtual void setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) = 0;
};

enum class PowerSwitch { wakeOnModem, wakeOnNetworkAccess, restartAfterPowerFailure, powerButtonSleep };

/// What wakes, restarts or puts to sleep the machine. Results of the setters go to the effects.
class PowerSwitchesService {
 public:
  virtual ~PowerSwitchesService() = default;

  /// Of what is to be read: that the machine cannot have it is told as its value.
  virtual bool supports(PowerSwitch which, const PowerSource& source) = 0;
  /// Of what is to be changed: that the machine cannot have it is told as an effect.
  virtual bool canSet(PowerSwitch which, const PowerSource& source) = 0;
  /// False when the machine does not support it.
  virtual bool isOn(PowerSwitch which, const PowerSource& source) = 0;
  virtual void setOn(PowerSwitch which, const PowerSource& source, bool on) = 0;

  /// Whether the machine restarts after a freeze, whatever feeds it.
  virtual bool restartsAfterFreeze() = 0;
  virtual void setRestartsAfterFreeze(bool restarts) = 0;
};

/// By which effects and reports call them.
const char* nameOf(SleepTimer timer);
const char* nameOf(PowerSwitch which);

class PowerSettingsService : public SleepTimersService, public PowerSwitchesService {};

}  // namespace tavisk
