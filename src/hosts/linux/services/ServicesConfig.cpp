// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/ServicesConfig.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"

namespace tavisk {
namespace {

constexpr std::size_t longestUnitName = 255;

// systemd.special(7): starting or stopping these changes the state of the whole machine.
constexpr std::string_view criticalTargets[] = {
    "basic",     "boot-complete", "ctrl-alt-del", "cryptsetup", "default",   "emergency",  "exit",
    "final",     "getty",         "graphical",    "halt",       "hibernate", "initrd",     "integritysetup",
    "kbrequest", "kexec",         "local-fs",     "multi-user", "network",   "paths",      "poweroff",
    "reboot",    "remote-fs",     "rescue",       "runlevel",   "shutdown",  "sigpwr",     "sleep",
    "slices",    "sockets",       "soft-reboot",  "suspend",    "swap",      "sysinit",    "system-update",
    "time-set",  "timers",        "umount",       "usb-gadget", "user",      "veritysetup"};
constexpr std::string_view criticalPrefixes[] = {"systemd-", "dbus.", "dbus-", "user@", "init."};

bool isUnitCharacter(char c) {
  return isLetterOrDigit(c) || std::string_view("@:._-").find(c) != std::string_view::npos;
}

bool isUnitName(const std::string& unit) {
  constexpr std::string_view endings[] = {".service", ".socket", ".target"};
  const auto ends = [&](std::string_view ending) { return unit.size() > ending.size() && unit.ends_with(ending); };
  return unit.size() <= longestUnitName && std::ranges::all_of(unit, isUnitCharacter) &&
         std::ranges::any_of(endings, ends);
}

/// "remote-fs-pre.target" and "hybrid-sleep.target" belong to their kind too.
bool isCritical(const std::string& unit) {
  const auto isPrefix = [&](std::string_view prefix) { return unit.starts_with(prefix); };
  if (std::ranges::any_of(criticalPrefixes, isPrefix)) return true;
  if (!unit.ends_with(".target")) return false;
  const auto isMeant = [&](std::string_view target) {
    return unit.starts_with(target) || unit.ends_with("-" + std::string(target) + ".target");
  };
  return std::ranges::any_of(criticalTargets, isMeant);
}

/// The words behind the last "purpose =".
std::vector<std::string> wordsOf(const std::string& text, std::string_view purpose) {
  std::vector<std::string> words;
  for (const auto& line : configurationLines(text))
    if (const auto named = namedValueIn(line); named && named->name == purpose) words = split(named->value, " \t\r");
  return words;
}

}  // namespace

Result<std::vector<std::string>> configuredUnits(const SystemRoot& root, std::string_view purpose) {
  const auto text = orEmpty(root.read(servicesConfig, configurationLimit));
  if (!text) return text.failure();
  auto units = wordsOf(*text, purpose);
  for (const auto& unit : units) {
    if (!isUnitName(unit)) return Failure{"use " + unit, servicesConfig, "a service, socket or target is expected"};
    if (isCritical(unit)) return Failure{"use " + unit, servicesConfig, "the machine depends on this unit"};
  }
  return units;
}

}  // namespace tavisk
