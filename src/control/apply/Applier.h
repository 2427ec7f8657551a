// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "control/Commands.h"
#include "control/StatusReader.h"
#include "control/WordRunner.h"
#include "control/apply/ApplyPlan.h"
#include "platform/Host.h"

namespace tavisk::control {

/// What became of a setting. A text that is absent is not known or does not apply.
struct AppliedSetting {
  const ManagedSetting* setting;
  std::string unit = {};  ///< see SettingValue
  std::optional<std::string> wanted = {};
  std::optional<std::string> before = {};        ///< in force, else stored
  std::optional<std::string> storedBefore = {};  ///< where another value was in force
  std::optional<std::string> after = {};         ///< the same, read again
  std::optional<std::string> stored = {};        ///< what will be after a restart
  Verdict verdict = Verdict::unchanged;
  std::string reason = {};  ///< why it is refused, not supported or has failed; harmless for a terminal
  std::string undoneBy = {};
  std::vector<std::string> notes = {};
  bool isChanged = false;  ///< the machine differs from before, whatever the verdict
  bool lasts = true;       ///< it will be so after a restart, as far as anybody knows
};

/// Gives a machine what is asked for, by the words of tavisk, where it differs.
class Applier final {
 public:
  /// Nothing is owned. Both tell of this host.
  Applier(Host& host, WordRunner& runner, StatusReader& reader) : _host(host), _runner(runner), _reader(reader) {}

  /// Looks at the settings of the step, runs its words unless all is as it is asked for, and looks again. One for each
  /// setting.
  std::vector<AppliedSetting> apply(const Step& step);
  /// Takes away what tavisk itself stores of the setting, and looks at it before and afterwards. Who else may change it
  /// is among those to whom it goes back: it lasts.
  AppliedSetting reset(const ManagedSetting& setting);
  SettingState stateOf(const ManagedSetting& setting);

 private:
  std::vector<SettingState> statesOf(const Step& step);
  std::vector<std::vector<std::string>> wordsOf(const Step& step, const SettingState& state);

  Host& _host;
  WordRunner& _runner;
  StatusReader& _reader;
};

/// Complains, and is true, where --allow-lockout is not given and the steps would close the way in: who has none
/// already does not lose one.
bool isLockoutRefused(std::span<const Step> steps, Applier& applier, const Invocation& invocation, const Tools& tools);

/// Whether a setting counts as what was asked for, by --skip-unsupported too.
bool isDone(Verdict verdict, bool lasts, const Invocation& invocation);

/// Opens the machine, hands over what changes it, and ends by its status; where that cannot be had, by saying why. An
/// ending signal gives the authorization up.
Status withApplier(const Tools& tools, const std::function<Status(Applier& applier)>& change);

}  // namespace tavisk::control
