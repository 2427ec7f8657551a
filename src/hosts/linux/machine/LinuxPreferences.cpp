// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/linux/machine/LinuxPreferences.h"

#include <algorithm>
#include <chrono>

#include "effects/SettingNames.h"
#include "hosts/linux/system/OnOff.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/ShellAssignments.h"
#include "hosts/shared/FileLock.h"
#include "hosts/shared/PropertyListFile.h"

namespace tavisk {
namespace {

constexpr const char* folder = "/etc/tavisk/preferences";
constexpr const char* lock = "/etc/tavisk/preferences/.lock";
constexpr const char* file = "/etc/tavisk/preferences/AnyApplication.plist";
constexpr std::chrono::seconds longestLock{3};

using Value = std::optional<std::string>;

/// A value that is no boolean reads as what it is: "string".
Result<Value> textIn(const Result<std::optional<PropertyList::Dictionary>>& preferences, const std::string& key) {
  if (!preferences) return preferences.failure();
  const auto* value = *preferences ? (*preferences)->find(key) : nullptr;
  if (!value) return Value();
  const auto* boolean = value->asBoolean();
  return Value(!boolean ? nameOf(value->type()) : onOff(*boolean));
}

constexpr std::size_t fileLimit = 65536;
constexpr const char* languages = "VelmarLanguages";

}  // namespace

LinuxPreferencesStore::LinuxPreferencesStore(const LinuxMachine& machine)
    : _machine(machine), _file(machine.root, file) {}

Setting<std::string> LinuxPreferencesStore::preference(const std::string& key) {
  Setting<std::string> setting;
  setting.name = setting::keyboardLockPreference;
  setting.where = _file.path();
  setting.stored = [this, key] { return textIn(_file.read(), key); };
  return setting;
}

std::optional<PropertyList> LinuxPreferencesStore::value(const std::string& key) {
  const auto preferences = _file.read();
  auto setting = preference(key);
  setting.stored = [&] { return textIn(preferences, key); };
  return observe(setting, _machine.effects) ? std::optional(*(*preferences)->find(key)) : std::nullopt;
}

void LinuxPreferencesStore::writeOut() {
  for (const auto& [key, value] : std::exchange(_pending, {})) {
    auto setting = preference(key);
    setting.store = [this, &key = key, value = value](const std::string&) { return store(key, value); };
    carryOut(setting, onOff(value), _machine.effects, _machine.runLoop);
  }
}

Result<void> LinuxPreferencesStore::store(const std::string& key, bool value) {
  if (auto failure = whyNeedsRoot("write", _file.path())) return *failure;
  if (auto made = _machine.root.makeFolders(folder); !made) return made;
  const auto patience = std::chrono::duration_cast<std::chrono::milliseconds>(_machine.runLoop.timeFor(longestLock));
  const auto held = lockFile(_machine.root, lock, patience);
  if (!held) return held.failure();
  auto preferences = _file.read().valueOr(std::nullopt).value_or(PropertyList::Dictionary());
  preferences.set(key, value);
  return _file.write(preferences);
}

/// Read anew each time: a change counts at once. Most machines have no such file.
std::optional<PropertyList> LinuxUserDefaults::value(const std::string& key) const {
  if (!_root.stamp(file)) return std::nullopt;
  const auto defaults = PropertyListFile(_root, file).read().valueOr(std::nullopt);
  const auto* value = defaults ? defaults->find(key) : nullptr;
  return !value ? std::nullopt : std::optional(*value);
}

bool LinuxUserDefaults::boolean(const std::string& key) {
  const auto found = value(key);
  return found && found->asBoolean() && *found->asBoolean();
}

std::optional<double> LinuxUserDefaults::number(const std::string& key) {
  const auto found = value(key);
  if (!found) return std::nullopt;
  if (const auto* integer = found->asInteger()) return static_cast<double>(*integer);
  return !found->asReal() ? std::nullopt : std::optional(*found->asReal());
}

std::vector<std::string> LinuxUserDefaults::strings(const std::string& key) {
  const auto found = value(key);
  std::vector<std::string> strings;
  if (found && found->asArray()) {
    for (const auto& member : *found->asArray())
      if (const auto* text = member.asString()) strings.push_back(*text);
  }
  return strings.empty() && key == languages ? machineLanguages() : strings;
}

/// "pt_BR" of "pt_BR.UTF-8@euro"; C and POSIX are no languages.
std::vector<std::string> LinuxUserDefaults::machineLanguages() const {
  for (const char* place : {"/etc/default/locale", "/etc/locale.conf"}) {
    const auto locale = assignedValue(_root.read(place, fileLimit).valueOr(""), "LANG").value_or("");
    const auto language = locale.substr(0, locale.find_first_of(".@"));
    if (!language.empty() && language != "C" && language != "POSIX") return {language};
  }
  return {};
}

}  // namespace tavisk
