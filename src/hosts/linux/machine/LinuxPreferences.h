// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "base/PropertyList.h"
#include "hosts/linux/machine/KeyboardLock.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/FailedLooks.h"
#include "hosts/shared/PropertyListFile.h"
#include "hosts/shared/PropertyListPreferences.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// A property list in /etc/tavisk/preferences, the administrator's as everything there. A file that cannot be
/// understood reads as none, and is kept as NAME.damaged before it is written anew.
class LinuxPreferencesStore final : public PreferencesStore {
 public:
  /// The controller is not owned.
  LinuxPreferencesStore(const LinuxMachine& machine, ManagementController& controller);

  std::optional<PropertyList> value(const std::string& key) override;

  /// What was set is done by writeOut() while no other run changes the machine: the keyboards and their preference
  /// stay together, and beside what other runs have stored meanwhile.
  void setDisablesKeyboard(bool disables) { _disablesKeyboard = disables; }
  void setBoolean(const std::string& key, bool value) { _pending.emplace_back(key, value); }
  void writeOut();
  /// Takes the preference out of the file, and enables the keyboards; see ResetService.
  void resetKeyboardLock();

 private:
  Setting<bool> preference(const std::string& key);
  Result<void> check() const;
  Result<void> store(const std::string& key, bool value, WrittenPlaces& written);

  LinuxMachine _machine;
  PropertyListFile _file;
  EnclosureLock _lock;
  std::optional<bool> _disablesKeyboard;
  std::vector<std::pair<std::string, bool>> _pending;
};

/// A property list that the administrator may write; one that cannot be understood reads as none. The languages, when
/// it has none, are those of the machine (locale.conf(5), or /etc/default/locale).
class LinuxUserDefaults final : public PropertyListDefaults {
 public:
  /// Neither is owned.
  LinuxUserDefaults(const SystemRoot& root, FailedLooks& looks) : _root(root), _looks(looks) {}

  static constexpr const char* file = "/etc/tavisk/preferences/tavisk.plist";

  Result<std::vector<std::string>> strings(const std::string& key) override;

 protected:
  Result<std::optional<PropertyList>> value(const std::string& key) const override;

 private:
  Result<std::string> machineLanguage() const;

  const SystemRoot& _root;
  FailedLooks& _looks;
};

}  // namespace tavisk
