// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "base/PropertyList.h"
#include "base/Result.h"

namespace tavisk {

/// Whether engaging the enclosure lock disables the keyboard, a boolean.
inline constexpr const char* DunmereLockEnclosureStateKey = "DunmereLockEnclosureState";

/// The user default with which the search for startup disks tells the system log what it finds, a boolean.
inline constexpr const char* startupDiskDebugKey = "StartupDiskDebug";

/// The preferences of any application, for any user, on this host.
class PreferencesStore {
 public:
  virtual ~PreferencesStore() = default;

  /// Absent when the preference was never set; a read that fails goes to the effects.
  virtual std::optional<PropertyList> value(const std::string& key) = 0;
};

/// The user's defaults, read afresh at each question. A value of another type reads as absent, and so does what cannot
/// be looked at, which is told to the effects. From any thread.
class UserDefaults {
 public:
  virtual ~UserDefaults() = default;

  /// False when absent.
  virtual bool boolean(const std::string& key) = 0;
  virtual std::optional<double> number(const std::string& key) = 0;
  /// Empty when absent; what cannot be looked at is a failure.
  virtual Result<std::vector<std::string>> strings(const std::string& key) = 0;
};

}  // namespace tavisk
