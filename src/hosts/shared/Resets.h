// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "base/Result.h"
#include "effects/EffectSink.h"
#include "effects/SettingNames.h"
#include "platform/PowerSettingsService.h"
#include "platform/ResetService.h"

namespace tavisk {

/// The resets of a host, each by the service that stores the setting.
class Resets final : public ResetService {
 public:
  using Rows = std::vector<std::pair<const char*, std::function<void()>>>;

  /// `rows` has each setting that may have a place of the tool's own, and is asked for when it is needed. The effects
  /// are not owned.
  Resets(EffectSink& effects, std::function<Rows()> rows) : _effects(effects), _rows(std::move(rows)) {}

  void reset(const std::string& setting) override;

 private:
  EffectSink& _effects;
  std::function<Rows()> _rows;
};

/// The rows of both hosts, by services that outlive them.
template <typename NetworkTime, typename PowerSettings, typename BootLoader, typename Preferences>
Resets::Rows resetRowsOf(NetworkTime& networkTime, PowerSettings& power, BootLoader& bootLoader,
                         Preferences& preferences) {
  return {
      {setting::networkTimeServer, [&] { networkTime.resetServer(); }},
      {setting::computerSleep, [&] { power.reset(SleepTimer::computer); }},
      {setting::displaySleep, [&] { power.reset(SleepTimer::display); }},
      {setting::hardDiskSleep, [&] { power.reset(SleepTimer::hardDisk); }},
      {setting::wakeOnModem, [&] { power.reset(PowerSwitch::wakeOnModem); }},
      {setting::wakeOnNetworkAccess, [&] { power.reset(PowerSwitch::wakeOnNetworkAccess); }},
      {setting::restartAfterFreeze, [&] { power.resetRestartAfterFreeze(); }},
      {setting::powerButtonSleep, [&] { power.reset(PowerSwitch::powerButtonSleep); }},
      {setting::kernelArchitecture, [&] { bootLoader.reset(); }},
      {setting::keyboardLockPreference, [&] { preferences.resetKeyboardLock(); }},
  };
}

}  // namespace tavisk
