// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/Misspellings.h"

#include <algorithm>
#include <numeric>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/scratch/KeyTable.h"

namespace tavisk {
namespace {

constexpr std::string_view settings[] = {
    setting::authorization,
    setting::time,
    setting::timeZone,
    setting::knownTimeZones,
    setting::networkTime,
    setting::networkTimeAtStartup,
    setting::networkTimeServer,
    setting::networkTimeRestart,
    setting::computerSleep,
    setting::displaySleep,
    setting::hardDiskSleep,
    setting::wakeOnModem,
    setting::wakeOnNetworkAccess,
    setting::restartAfterPowerFailure,
    setting::restartAfterFreeze,
    setting::powerButtonSleep,
    setting::startupDelay,
    setting::remoteLogin,
    setting::remoteEvents,
    setting::computerName,
    setting::localSubnetName,
    setting::dynamicStore,
    setting::kernelArchitecture,
    setting::keyboardLock,
    setting::keyboardLockPreference,
    setting::preferencesWrite,
    setting::signalToProcess,
    setting::startupDisk,
    setting::networkStartupDisk,
    setting::firmwareVariable,
};
constexpr std::string_view everySetting = "*";
constexpr std::string_view refusedRead = " (read)";
constexpr const char* refusals = "Refusals";

using Names = std::vector<std::string>;

/// How many letters have to be put in, taken out or replaced.
std::size_t distanceBetween(std::string_view one, std::string_view other) {
  std::vector<std::size_t> row(other.size() + 1);
  std::iota(row.begin(), row.end(), 0);
  for (std::size_t i = 0; i < one.size(); ++i) {
    auto diagonal = row[0];
    row[0] = i + 1;
    for (std::size_t j = 0; j < other.size(); ++j) {
      const auto replaced = diagonal + (one[i] == other[j] ? 0 : 1);
      diagonal = row[j + 1];
      row[j + 1] = std::min({row[j] + 1, row[j + 1] + 1, replaced});
    }
  }
  return row.back();
}

bool isLike(std::string_view written, std::string_view name) {
  constexpr std::size_t mostSlips = 2;
  constexpr std::size_t lettersToOne = 3;
  const auto plain = [](std::string_view text) {
    auto letters = lowerCased(text);
    std::erase_if(letters, [](char letter) { return letter == ' ' || letter == '-' || letter == '_'; });
    return letters;
  };
  const auto meant = plain(name);
  const auto letters = plain(written);
  const auto longer = std::max(letters.size(), meant.size());
  return longer - std::min(letters.size(), meant.size()) <= mostSlips &&
         distanceBetween(letters, meant) <= std::min(mostSlips, meant.size() / lettersToOne);
}

/// Null when no key of that place is like the one that is written.
const KeyRow* rowLike(std::string_view place, std::string_view written) {
  const auto rows = keyTable();
  const auto row = std::ranges::find_if(
      rows, [&](const KeyRow& known) { return known.place == place && isLike(written, known.key); });
  return row == rows.end() ? nullptr : &*row;
}

std::string isMeant(std::string_view name) {
  return " (is " + inQuotes(name) + " meant?)";
}

bool isSetting(std::string_view name) {
  return name == everySetting || std::ranges::any_of(settings, [&](auto setting) {
           return setting == setting::firmwareVariable ? name.starts_with(setting) : name == setting;
         });
}

void addRefusals(const PropertyList::Dictionary& refused, Names& names) {
  for (const auto& [key, reason] : refused) {
    std::string_view name = key;
    if (name.ends_with(refusedRead)) name.remove_suffix(refusedRead.size());
    if (isSetting(name)) continue;
    const auto* meant = std::ranges::find_if(settings, [&](auto setting) { return isLike(name, setting); });
    const auto note = meant == std::end(settings) ? " (no setting is called so)" : isMeant(*meant);
    names.push_back(inQuotes(refusals) + " " + inQuotes(key) + note);
  }
}

void addNamesAt(std::string_view place, const std::string& way, const PropertyList::Dictionary& values, Names& names);

void addNamesInside(const KeyRow& row, const std::string& way, const PropertyList& value, Names& names) {
  const auto place = placeUnder(row);
  if (row.type == KeyType::dictionary && place == refusals) return addRefusals(*value.asDictionary(), names);
  if (row.type == KeyType::dictionary) return addNamesAt(place, way, *value.asDictionary(), names);
  if (row.type != KeyType::dictionaries) return;
  for (const auto& member : *value.asArray()) addNamesAt(place + "/*", way, *member.asDictionary(), names);
}

void addNamesAt(std::string_view place, const std::string& way, const PropertyList::Dictionary& values, Names& names) {
  for (const auto& [key, value] : values) {
    if (const auto* row = findKey(place, key)) {
      addNamesInside(*row, way + inQuotes(key) + " ", value, names);
      continue;
    }
    if (const auto* meant = rowLike(place, key)) names.push_back(way + inQuotes(key) + isMeant(meant->key));
  }
}

}  // namespace

std::span<const std::string_view> refusableSettings() {
  return settings;
}

std::vector<std::string> misspeltNames(const PropertyList::Dictionary& machine) {
  Names names;
  addNamesAt("", "", machine, names);
  return names;
}

}  // namespace tavisk
