// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "platform/PreferencesStore.h"
#include "platform/PropertyListFile.h"
#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// A property list in /etc/tavisk/preferences, the administrator's as everything there. A file that cannot be
/// understood reads as none, and is kept as NAME.damaged before it is written anew.
class LinuxPreferencesStore final : public PreferencesStore {
 public:
  explicit LinuxPreferencesStore(const LinuxMachine& machine);

  std::optional<PropertyList> value(const std::string& key) override;

  /// What was set is stored by writeOut(), together with what other runs have stored meanwhile.
  void setBoolean(const std::string& key, bool value) { _pending.emplace_back(key, value); }
  void writeOut();

 private:
  Setting preference(const std::string& key);
  Result<void> store(const std::string& key, bool value);

  LinuxMachine _machine;
  PropertyListFile _file;
  std::vector<std::pair<std::string, bool>> _pending;
};

}  // namespace tavisk
