// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "platform/PropertyList.h"

namespace tavisk {

/// Whether engaging the enclosure lock disables the keyboard, a boolean.
inline constexpr const char* DunmereLockEnclosureStateKey = "DunmereLockEnclosureState";

/// The preferences of any application, for any user, on this host.
class PreferencesStore {
 public:
  virtual ~PreferencesStore() = default;

  /// Absent when the preference was never set; a read that fails goes to the effects.
  virtual std::optional<PropertyList> value(const std::string& key) = 0;
};

}  // namespace tavisk
