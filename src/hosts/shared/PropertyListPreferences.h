// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/PropertyList.h"
#include "hosts/shared/SettingChange.h"
#include "platform/Preferences.h"

namespace tavisk {

/// A preference as a switch; one that is no boolean is off, and told as what it is: "string".
Reading<bool> switchIn(const PropertyList& preference);

/// The defaults of a user out of property lists.
class PropertyListDefaults : public UserDefaults {
 public:
  bool boolean(const std::string& key) override;
  std::optional<double> number(const std::string& key) override;
  Result<std::vector<std::string>> strings(const std::string& key) override;

 protected:
  /// Of any type; absent when there is none. Tells the effects when it cannot be looked at.
  virtual Result<std::optional<PropertyList>> value(const std::string& key) const = 0;
};

}  // namespace tavisk
