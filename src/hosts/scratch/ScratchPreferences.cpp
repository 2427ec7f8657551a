// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchPreferences.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* preferencesSection = "Preferences";
constexpr const char* writes = "Preferences Writes";

MachineSetting<bool> preference(const std::string& key) {
  return {setting::keyboardLockPreference, "",
          [=](MachineFile& machine) {
            const auto preferences = machine.section(preferencesSection);
            const auto* value = preferences.find(key);
            return value ? std::optional(switchIn(*value)) : std::nullopt;
          },
          [=](MachineFile::Dictionary& machine, bool isOn) { machine.dictionary(preferencesSection).set(key, isOn); }};
}

}  // namespace

MachineSetting<bool> keyboardsDisabled() {
  return switchAt(setting::keyboardLock, "Enclosure Lock", "Keyboard Disabled");
}

std::optional<PropertyList> ScratchPreferencesStore::value(const std::string& key) {
  if (!_settings.read(preference(key))) return std::nullopt;
  const auto preferences = _settings.section(preferencesSection);
  const auto* value = preferences.find(key);
  return value ? std::optional(*value) : std::nullopt;
}

void ScratchPreferencesStore::setBoolean(const std::string& key, bool value) {
  _settings.change(preference(key), value);
}

void ScratchPreferencesStore::resetKeyboardLock() {
  const std::string key = DunmereLockEnclosureStateKey;
  const auto effect = _settings.reset(preference(key), ownAt(preferencesSection, key));
  if (effect.outcome != Outcome::applied) return;
  _settings.change(keyboardsDisabled(), false);
  writeOut();
}

void ScratchPreferencesStore::writeOut() {
  _settings.change(countAt(setting::preferencesWrite, "", writes), "write");
}

Result<std::optional<PropertyList>> ScratchUserDefaults::value(const std::string& key) const {
  const auto defaults = _machine.section("User Defaults");
  const auto* value = defaults.find(key);
  return value ? std::optional(*value) : std::nullopt;
}

}  // namespace tavisk
