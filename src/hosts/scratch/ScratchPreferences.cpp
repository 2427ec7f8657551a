// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/scratch/ScratchPreferences.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* section = "Preferences";
constexpr const char* writes = "Preferences Writes";

/// A boolean reads as "on" or "off", any other value as what it is: "string".
std::string textOf(const PropertyList& value) {
  const auto* boolean = value.asBoolean();
  if (!boolean) return nameOf(value.type());
  return *boolean ? "on" : "off";
}

MachineSetting preference(const std::string& key) {
  return {setting::keyboardLockPreference, "",
          [=](MachineFile& machine) -> MachineSetting::Value {
            const auto preferences = machine.section(section);
            const auto* value = preferences.find(key);
            return value ? std::optional(textOf(*value)) : std::nullopt;
          },
          [=](MachineFile::Dictionary& machine, const std::string& value) {
            machine.dictionary(section).set(key, value == "on");
          }};
}

}  // namespace

std::optional<PropertyList> ScratchPreferencesStore::value(const std::string& key) {
  if (!_settings.read(preference(key))) return std::nullopt;
  const auto preferences = _settings.section(section);
  const auto* value = preferences.find(key);
  return value ? std::optional(*value) : std::nullopt;
}

void ScratchPreferencesStore::setBoolean(const std::string& key, bool value) {
  _settings.turn(preference(key), value);
}

void ScratchPreferencesStore::writeOut() {
  const auto count = [](MachineFile::Dictionary& machine, const std::string&) { countUp(machine, writes); };
  _settings.change({setting::preferencesWrite, "", nullptr, count}, "write");
}

bool ScratchUserDefaults::boolean(const std::string& key) {
  const auto defaults = section();
  const auto* value = defaults.find(key);
  return value && value->asBoolean() && *value->asBoolean();
}

std::optional<double> ScratchUserDefaults::number(const std::string& key) {
  const auto defaults = section();
  const auto* value = defaults.find(key);
  if (!value) return std::nullopt;
  if (const auto* integer = value->asInteger()) return static_cast<double>(*integer);
  return !value->asReal() ? std::nullopt : std::optional(*value->asReal());
}

std::vector<std::string> ScratchUserDefaults::strings(const std::string& key) {
  const auto defaults = section();
  const auto* value = defaults.find(key);
  std::vector<std::string> strings;
  if (!value || !value->asArray()) return strings;
  for (const auto& member : *value->asArray())
    if (const auto* text = member.asString()) strings.push_back(*text);
  return strings;
}

}  // namespace tavisk
