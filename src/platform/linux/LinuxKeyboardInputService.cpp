// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxKeyboardInputService.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "platform/linux/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr std::size_t fileLimit = 65536;

constexpr std::array<std::pair<std::string_view, std::int64_t>, 32> countryCodes{{
    {"ara", 1}, {"be", 2},  {"ca", 4},  {"cz", 5},  {"dk", 6},  {"fi", 7},  {"fr", 8},     {"de", 9},
    {"gr", 10}, {"il", 11}, {"hu", 12}, {"it", 14}, {"jp", 15}, {"kr", 16}, {"latam", 17}, {"nl", 18},
    {"no", 19}, {"ir", 20}, {"pl", 21}, {"pt", 22}, {"ru", 23}, {"sk", 24}, {"es", 25},    {"se", 26},
    {"ch", 28}, {"tw", 30}, {"tr", 31}, {"gb", 32}, {"uk", 32}, {"us", 33}, {"rs", 34},    {"sg", 28},
}};

/// "de" of "de,us", "de-latin1" and "de_nodeadkeys".
std::string_view firstName(std::string_view layouts) {
  return layouts.substr(0, layouts.find_first_of(",-_"));
}

}  // namespace

std::string LinuxKeyboardInputService::layout() const {
  const auto keyboard = _root.read("/etc/default/keyboard", fileLimit).valueOr("");
  if (auto layout = assignedValue(keyboard, "XKBLAYOUT")) return *layout;
  const auto console = _root.read("/etc/vconsole.conf", fileLimit).valueOr("");
  if (auto layout = assignedValue(console, "XKBLAYOUT")) return *layout;
  return assignedValue(console, "KEYMAP").value_or("");
}

std::optional<std::int64_t> LinuxKeyboardInputService::currentLayoutNumber() {
  const auto current = layout();
  const auto* known = std::find_if(countryCodes.begin(), countryCodes.end(),
                                   [&](const auto& entry) { return entry.first == firstName(current); });
  return known == countryCodes.end() ? std::nullopt : std::optional(known->second);
}

}  // namespace tavisk
