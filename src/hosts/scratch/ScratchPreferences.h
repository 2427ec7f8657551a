// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/MachineSettings.h"
#include "hosts/shared/PropertyListPreferences.h"

namespace tavisk {

/// Whether the keyboards are disabled now.
MachineSetting<bool> keyboardsDisabled();

/// "Preferences".
class ScratchPreferencesStore final : public PreferencesStore {
 public:
  explicit ScratchPreferencesStore(MachineSettings& settings) : _settings(settings) {}

  std::optional<PropertyList> value(const std::string& key) override;
  void setBoolean(const std::string& key, bool value);
  /// Counts it.
  void writeOut();
  /// Takes the preference out of the machine file, and enables the keyboards; see ResetService.
  void resetKeyboardLock();

 private:
  MachineSettings& _settings;
};

/// "User Defaults".
class ScratchUserDefaults final : public PropertyListDefaults {
 public:
  explicit ScratchUserDefaults(MachineFile& machine) : _machine(machine) {}

 protected:
  Result<std::optional<PropertyList>> value(const std::string& key) const override;

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
