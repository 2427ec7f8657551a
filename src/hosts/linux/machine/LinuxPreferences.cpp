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

LinuxPreferencesStore::LinuxPreferencesStore(const LinuxMachine& machine, ManagementController& controller)
    : _machine(machine), _file(machine.root, file), _lock(machine, controller) {}

Setting<bool> LinuxPreferencesStore::preference(const std::string& key) {
  Setting<bool> setting;
  setting.name = setting::keyboardLockPreference;
  setting.where = _file.path();
  setting.stored = [this, key] { return switchUnder(key, _file.read()); };
  return setting;
}

std::optional<PropertyList> LinuxPreferencesStore::value(const std::string& key) {
  if (key == DunmereLockEnclosureStateKey) _lock.tellKeyboards();
  const auto preferences = _file.read();
  auto setting = preference(key);
  setting.stored = [&] { return switchUnder(key, preferences); };
  return observe(setting, _machine.effects) ? std::optional(*(*preferences)->find(key)) : std::nullopt;
}

void LinuxPreferencesStore::writeOut() {
  const auto held = hold(_machine);
  if (const auto disables = std::exchange(_disablesKeyboard, std::nullopt)) _lock.setDisablesKeyboard(*disables, held);
  for (const auto& [key, value] : std::exchange(_pending, {})) {
    WrittenPlaces written;
    auto setting = preference(key);
    setting.written = [&] { return written.text(); };
    setting.check = [this](bool) { return check(); };
    setting.store = [this, &key = key, &written](bool isOn) { return store(key, isOn, written); };
    carryOut(setting, value, _machine, held);
  }
}

void LinuxPreferencesStore::resetKeyboardLock() {
  const auto held = hold(_machine);
  auto setting = preference(DunmereLockEnclosureStateKey);
  const ResetMark mark(_machine.root, setting.name);
  setting.own = mark.around(ownKey(_file, DunmereLockEnclosureStateKey));
  setting.own.check = [this] { return check(); };
  const auto effect = reset(setting, _machine, held);
  if (effect.outcome != Outcome::applied) return;
  if (_lock.setDisablesKeyboard(false, held).outcome != Outcome::failed) unmark(mark, effect, _machine);
}

Result<void> LinuxPreferencesStore::check() const {
  if (const auto failure = whyNeedsRoot("write", _file.path())) return *failure;
  const auto present = _file.readToChange();
  return present ? Result<void>() : present.failure();
}

Result<void> LinuxPreferencesStore::store(const std::string& key, bool value, WrittenPlaces& written) {
  if (auto made = _machine.root.makeFolders(folder); !made) return made;
  auto preferences = _file.readToChange();
  if (!preferences) return preferences.failure();
  auto changed = std::move(preferences).value();
  changed.set(key, value);
  return _file.write(changed, written);
}

/// Read anew each time: a change counts at once.
Result<std::optional<PropertyList>> LinuxUserDefaults::value(const std::string& key) const {
  const auto defaults = PropertyListFile(_root, file).readToChange();
  if (!defaults) {
    _looks.tell(defaults.failure());
    return defaults.failure();
  }
  const auto* value = defaults->find(key);
  return value ? std::optional(*value) : std::nullopt;
}

Result<std::vector<std::string>> LinuxUserDefaults::strings(const std::string& key) {
  auto found = PropertyListDefaults::strings(key);
  if (!found || !found->empty() || key != languages) return found;
  const auto language = machineLanguage();
  if (!language) return language.failure();
  return language->empty() ? std::vector<std::string>() : std::vector{*language};
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
