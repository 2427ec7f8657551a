// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "control/ManagedSettings.h"
#include "control/StatusReader.h"
#include "platform/ChangeHistory.h"

namespace tavisk::control {

/// What is to become of a setting that was changed.
enum class UndoStep {
  set,        ///< it gets the value from before
  reset,      ///< it had none before: what the tool keeps of it is taken away
  there,      ///< it has that value
  leave,      ///< it waits for consent
  impossible  ///< it cannot be taken back
};

/// "set", "reset", "there already", "left alone", "not possible".
const char* nameOf(UndoStep step);

/// A setting that was changed, and the value that it had before.
struct PlannedUndo {
  std::string setting = {};  ///< one of effects/SettingNames.h
  UndoStep step = UndoStep::impossible;
  std::optional<std::string> now = {};      ///< absent: none, or not known
  std::optional<std::string> back = {};     ///< absent: there was none, or it is not known
  std::string unit = {};                    ///< of both; see SettingValue
  std::string why = {};                     ///< why it is left alone or cannot be taken back
  const ManagedSetting* managed = nullptr;  ///< of what is to be set or reset
};

/// What is taken back only when it is asked for.
struct UndoConsent {
  bool toOthersChanges = false;  ///< of what somebody else has changed since, or where that cannot be seen
  bool toLockout = false;        ///< of remote login that goes off
};

/// The changes since then, by seconds since 1970 UTC; without a time those of the last run that has changed something.
/// What has no value, such as telling a daemon to read its files again, is not among them.
std::vector<RecordedChange> chosenChanges(std::span<const RecordedChange> changes, std::optional<std::int64_t> since);

/// The settings whose state a plan for these changes asks for, once each.
std::vector<const ManagedSetting*> settingsOf(std::span<const RecordedChange> changes);

/// Each setting that was changed goes back to the value before the first of these changes; in the order of the
/// settings. `states` are those of settingsOf().
std::vector<PlannedUndo> planUndo(std::span<const RecordedChange> changes, std::span<const SettingState> states,
                                  UndoConsent consent);

}  // namespace tavisk::control
