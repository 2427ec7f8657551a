// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "base/Result.h"
#include "control/ManagedSettings.h"
#include "effects/Effect.h"

namespace tavisk::control {

/// A value as a user has written it down.
using WrittenValue = std::variant<bool, std::int64_t, std::string>;

/// The value as effects and status tell it: "on", "10" minutes, "4" units of 30 seconds, a name. A moment that is
/// written as a date and a time of day stays one, "2026-11-22 16:30:00", until it is known in which zone it is meant.
/// `unit` is that of a value which status tells; empty: numbers are minutes, seconds of the start-up delay, and seconds
/// since 1970. The failure says what is expected.
Result<std::string> valueMeantBy(const ManagedSetting& setting, const WrittenValue& written,
                                 const std::string& unit = "");

/// What was read of a setting as far as it is what the setting was set to; see ManagedSetting::isWhatIsStored.
SettingValue asSet(SettingValue value);

/// Whether both texts are one value of the setting. Of moments those are that lie at most two seconds apart, as they
/// pass while they are read; dates and times of day are those of the process's zone.
bool isSameValue(const ManagedSetting& setting, const std::string& left, const std::string& right);

/// The words of tavisk that give the setting a value, each with its argument; none when it has no such form. A moment
/// is told in the process's zone.
std::vector<std::vector<std::string>> setterWords(const ManagedSetting& setting, const std::string& value);

/// What a word of tavisk asks of a setting.
struct AskedValue {
  const ManagedSetting* setting;
  /// Absent: it cannot be told before the word is run, or the word does not take such an argument.
  std::optional<std::string> value;
};

/// The settings that a word changes, which is typed in any case and with or without its dash; none when it changes
/// nothing.
std::vector<AskedValue> askedBy(const std::string& word, const std::string& argument);

}  // namespace tavisk::control
