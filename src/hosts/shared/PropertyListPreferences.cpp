// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/PropertyListPreferences.h"

namespace tavisk {

Reading<bool> switchIn(const PropertyList& preference) {
  const auto* isOn = preference.asBoolean();
  return isOn ? Reading(*isOn) : Reading(false, nameOf(preference.type()));
}

bool PropertyListDefaults::boolean(const std::string& key) {
  const auto found = value(key);
  return found && found->asBoolean() && *found->asBoolean();
}

std::optional<double> PropertyListDefaults::number(const std::string& key) {
  const auto found = value(key);
  if (!found) return std::nullopt;
  if (const auto* integer = found->asInteger()) return static_cast<double>(*integer);
  return found->asReal() ? std::optional(*found->asReal()) : std::nullopt;
}

std::vector<std::string> PropertyListDefaults::strings(const std::string& key) {
  const auto found = value(key);
  std::vector<std::string> strings;
  if (!found || !found->asArray()) return strings;
  for (const auto& member : *found->asArray())
    if (const auto* text = member.asString()) strings.push_back(*text);
  return strings;
}

}  // namespace tavisk
