// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxPreferencesStore.h"

#include <chrono>

#include "platform/FileLock.h"
#include "platform/SettingNames.h"
#include "platform/linux/OnOff.h"

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
  if (value == nullptr) return Value();
  const auto* boolean = value->asBoolean();
  return Value(boolean == nullptr ? nameOf(value->type()) : onOff(*boolean));
}

}  // namespace

LinuxPreferencesStore::LinuxPreferencesStore(const LinuxMachine& machine)
    : _machine(machine), _file(machine.root, file) {}

Setting LinuxPreferencesStore::preference(const std::string& key) {
  Setting setting;
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

}  // namespace tavisk
