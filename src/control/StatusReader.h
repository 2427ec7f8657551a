// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

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

/// Reads settings by their getters, and keeps what those tell instead of what they print.
class StatusReader final : public EffectChannel {
 public:
  /// Nothing is owned. The host tells its effects to the sink, to which this has to be a channel.
  StatusReader(Host& host, RunLoop& runLoop) : _host(host), _runLoop(runLoop) {}

  /// For each of the settings its own state, then those that its getter told besides and that no setting is named for.
  std::vector<SettingState> read(const std::vector<const ManagedSetting*>& settings);

  void record(const Effect& effect) override;
  void observe(const SettingValue& value) override;
  bool wantsValues() const override { return true; }
  bool wantsPlaces() const override { return true; }

 private:
  SettingState& stateOf(const std::string& setting);

  Host& _host;
  RunLoop& _runLoop;
  const ManagedSetting* _current = nullptr;
  std::vector<SettingState> _states;
};

}  // namespace tavisk::control
