// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/PropertyListPreferences.h"

namespace tavisk {

Reading<bool> switchIn(const PropertyList& preference) {
  const auto* isOn = preference.asBoolean();
  return isOn ? Reading(*isOn) : Reading(false, nameOf(preference.type()));
}

bool PropertyListDefaults::boolean(const std::string& key) {
  const auto found = value(key).valueOr(std::nullopt);
  return found && found->asBoolean() && *found->asBoolean();
}

std::optional<double> PropertyListDefaults::number(const std::string& key) {
  const auto found = value(key).valueOr(std::nullopt);
  if (!found) return std::nullopt;
  if (const auto* integer = found->asInteger()) return static_cast<double>(*integer);
  return found->asReal() ? std::optional(*found->asReal()) : std::nullopt;
}

Result<std::vector<std::string>> PropertyListDefaults::strings(const std::string& key) {
  const auto found = value(key);
  if (!found) return found.failure();
  std::vector<std::string> strings;
  const auto* members = *found ? (*found)->asArray() : nullptr;
  if (!members) return strings;
  for (const auto& member : *members)
    if (const auto* text = member.asString()) strings.push_back(*text);
  return strings;
}

}  // namespace tavisk
