// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>
#include <string>

#include "control/StatusReader.h"

namespace tavisk::control {

/// A value as people read it: "10 minutes" for 10 in minutes, "never" for none of them, a date and time of day in the
/// process's time zone. What it tells besides a number stays as it is.
std::string shownValue(const std::string& value, const std::string& unit);

/// The same as a cell of a table, harmless for a terminal: a hyphen where there is none.
std::string shownAny(const std::optional<std::string>& value, const std::string& unit);

/// The states as a table with a line of headings; what else is to be said of a setting stands below it, indented.
/// Harmless for a terminal.
std::string statusTable(std::span<const SettingState> states);

/// The states as one JSON object without a newline, by the names of the settings; see taviskctl(8).
std::string statusJson(std::span<const SettingState> states);

}  // namespace tavisk::control
