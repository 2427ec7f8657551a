// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <mutex>
#include <string>
#include <vector>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "control/ManagedSettings.h"
#include "effects/EffectSink.h"
#include "platform/Host.h"

namespace tavisk::control {

/// What a getter found out of one setting.
struct SettingState {
  SettingValue value;
  std::vector<Failure> failures;  ///< of its reads
};

/// Reads settings by their getters, and keeps what those tell instead of what they print. Others than the thread that
/// reads may tell as well, as when a signal ends the process.
class StatusReader final : public EffectChannel {
 public:
  /// For each of the settings its own state, then those that its getter told besides and that no setting is named for.
  /// The host tells its effects to a sink of which this is a channel.
  std::vector<SettingState> read(const std::vector<const ManagedSetting*>& settings, Host& host, RunLoop& runLoop);
  /// The same by who calls a setting's getter.
  using Get = std::function<void(const ManagedSetting& setting)>;
  std::vector<SettingState> read(const std::vector<const ManagedSetting*>& settings, const Get& get);

  void record(const Effect& effect) override;
  void observe(const SettingValue& value) override;
  bool wantsValues() const override { return true; }
  bool wantsPlaces() const override { return true; }

 private:
  void begin(const ManagedSetting& setting);
  SettingState& stateOf(const std::string& setting);

  std::mutex _mutex;                         // guards what follows
  const ManagedSetting* _current = nullptr;  ///< whose getter is called
  std::vector<SettingState> _states;
};

}  // namespace tavisk::control
