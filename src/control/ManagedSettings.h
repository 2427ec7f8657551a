// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"

namespace tavisk::control {

/// What the values of a setting are.
enum class ValueKind {
  moment,        ///< seconds since 1970, set by a date and a time of day
  onOff,         ///< a switch: "on", "off"
  minutes,       ///< a number of them, of which 0 is never
  startupDelay,  ///< units of 30 seconds, set in seconds
  architecture,  ///< of the kernel
  text,          ///< a name, an address
  startupDisk,   ///< a disk, set by its folder or its name
};

/// A setting as the words of tavisk reach it.
struct ManagedSetting {
  std::string_view name;    ///< as effects and reports call it
  std::string_view getter;  ///< a word of the command table, "-gettimezone"
  std::string_view setter;
  ValueKind kind;
  /// Its getter looks at every disk, which takes seconds: only when it is asked for.
  bool isSearched = false;
  /// What it is set to is what is stored: what status tells as in force may be something else meanwhile, such as the
  /// time server that answers while the one that is set does not.
  bool isWhatIsStored = false;
};

/// Every setting, in the order in which they are shown.
std::span<const ManagedSetting> managedSettings();

/// The one that effects and reports call so; null when there is none.
const ManagedSetting* managedNamed(std::string_view name);

/// The setting that a user means: by its name, or by what follows "get" in its word; without regard to case, spaces,
/// hyphens and underscores. Null when there is none.
const ManagedSetting* settingMeantBy(std::string_view text);

/// Those that a user means, once each. The failure says which text means none.
Result<std::vector<const ManagedSetting*>> settingsMeantBy(std::span<const std::string> texts);

}  // namespace tavisk::control
