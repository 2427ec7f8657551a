// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxUserDefaults.h"

#include <algorithm>

#include "platform/PropertyListFile.h"
#include "platform/linux/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr std::size_t fileLimit = 65536;
constexpr const char* languages = "VelmarLanguages";

}  // namespace

/// Read anew each time: a change counts at once. Most machines have no such file.
std::optional<PropertyList> LinuxUserDefaults::value(const std::string& key) const {
  if (!_root.stamp(file)) return std::nullopt;
  const auto defaults = PropertyListFile(_root, file).read().valueOr(std::nullopt);
  const auto* value = defaults ? defaults->find(key) : nullptr;
  return value == nullptr ? std::nullopt : std::optional(*value);
}

bool LinuxUserDefaults::boolean(const std::string& key) {
  const auto found = value(key);
  return found && found->asBoolean() != nullptr && *found->asBoolean();
}

std::optional<double> LinuxUserDefaults::number(const std::string& key) {
  const auto found = value(key);
  if (!found) return std::nullopt;
  if (const auto* integer = found->asInteger()) return static_cast<double>(*integer);
  return found->asReal() == nullptr ? std::nullopt : std::optional(*found->asReal());
}

std::vector<std::string> LinuxUserDefaults::strings(const std::string& key) {
  const auto found = value(key);
  std::vector<std::string> strings;
  if (found && found->asArray() != nullptr) {
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
