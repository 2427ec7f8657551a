// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/LinuxPreferences.h"

#include "effects/SettingNames.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr const char* folder = "/etc/tavisk/preferences";
constexpr const char* file = "/etc/tavisk/preferences/AnyApplication.plist";
constexpr const char* languages = "VelmarLanguages";
constexpr const char* localeFiles[] = {"/etc/default/locale", "/etc/locale.conf"};

Setting<bool>::Found switchUnder(const std::string& key,
                                 const Result<std::optional<PropertyList::Dictionary>>& preferences) {
  if (!preferences) return preferences.failure();
  const auto* value = *preferences ? (*preferences)->find(key) : nullptr;
  return value ? std::optional(switchIn(*value)) : std::nullopt;
}

}  // namespace

LinuxPreferencesStore::LinuxPreferencesStore(const LinuxMachine& machine)
    : _machine(machine), _file(machine.root, file) {}

Setting<bool> LinuxPreferencesStore::preference(const std::string& key) {
  Setting<bool> setting;
  setting.name = setting::keyboardLockPreference;
  setting.where = _file.path();
  setting.stored = [this, key] { return switchUnder(key, _file.read()); };
  return setting;
}

std::optional<PropertyList> LinuxPreferencesStore::value(const std::string& key) {
  const auto preferences = _file.read();
  auto setting = preference(key);
  setting.stored = [&] { return switchUnder(key, preferences); };
  return observe(setting, _machine.effects) ? std::optional(*(*preferences)->find(key)) : std::nullopt;
}

void LinuxPreferencesStore::writeOut() {
  for (const auto& [key, value] : std::exchange(_pending, {})) {
    auto setting = preference(key);
    setting.store = [this, &key = key](bool isOn) { return store(key, isOn); };
    carryOut(setting, value, _machine);
  }
}

Result<void> LinuxPreferencesStore::store(const std::string& key, bool value) {
  if (const auto failure = whyNeedsRoot("write", _file.path())) return *failure;
  if (auto made = _machine.root.makeFolders(folder); !made) return made;
  auto preferences = _file.readToChange();
  if (!preferences) return preferences.failure();
  auto changed = std::move(preferences).value();
  changed.set(key, value);
  return _file.write(changed);
}

/// Read anew each time: a change counts at once.
std::optional<PropertyList> LinuxUserDefaults::value(const std::string& key) const {
  const auto defaults = PropertyListFile(_root, file).readToChange();
  if (!defaults && key == languages) _looks.tellDoubt(defaults.failure());
  if (!defaults) _looks.tell(defaults.failure());
  const auto* value = defaults ? defaults->find(key) : nullptr;
  return value ? std::optional(*value) : std::nullopt;
}

std::vector<std::string> LinuxUserDefaults::strings(const std::string& key) {
  auto found = PropertyListDefaults::strings(key);
  if (!found.empty() || key != languages) return found;
  const auto language = machineLanguage();
  if (!language) _looks.tellDoubt(language.failure());
  return language && !language->empty() ? std::vector{*language} : std::vector<std::string>();
}

/// "pt_BR" of "pt_BR.UTF-8@euro"; C and POSIX are no languages. Empty without one.
Result<std::string> LinuxUserDefaults::machineLanguage() const {
  for (const auto* place : localeFiles) {
    const auto assigned = assignedValue(_root, place, "LANG");
    if (!assigned) return assigned.failure();
    const auto locale = assigned->value_or("");
    auto language = locale.substr(0, locale.find_first_of(".@"));
    if (!language.empty() && language != "C" && language != "POSIX") return language;
  }
  return "";
}

}  // namespace tavisk
