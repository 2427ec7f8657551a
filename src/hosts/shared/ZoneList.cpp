// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/ZoneList.h"

#include <algorithm>
#include <set>
#include <sstream>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t largestTable = 4U << 20U;
constexpr std::size_t largestZone = 1U << 20U;
constexpr int deepestZone = 4;  // "America/Argentina/Buenos_Aires" needs 3

using Names = std::set<std::string>;

Result<std::string> readTable(const SystemRoot& root, const char* name) {
  return root.read(ZoneName{name}.file(), largestTable);
}

/// The fields of each line, as white space separates them.
template <typename Use>
void forEachLine(const std::string& text, Use use) {
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) use(split(line, " \t"));
}

Names namesOfSource(const std::string& text) {
  Names names;
  forEachLine(text, [&](const std::vector<std::string>& fields) {
    if (fields.size() > 1 && fields[0] == "Z") names.insert(fields[1]);
    if (fields.size() > 2 && fields[0] == "L") names.insert(fields[2]);
  });
  return names;
}

Names namesOfTable(const std::string& text) {
  Names names{"UTC"};
  forEachLine(text, [&](const std::vector<std::string>& fields) {
    if (fields.size() > 2 && !fields[0].starts_with('#')) names.insert(fields[2]);
  });
  return names;
}

/// The source and the table also name zones that a package of their own brings.
void removeUninstalled(const SystemRoot& root, Names& names) {
  std::erase_if(names, [&](const std::string& name) { return !root.exists(ZoneName{name}.file()); });
}

/// Other trees of the same zones, and files that are no zones.
bool isNoZone(const std::string& name) {
  return std::ranges::find(ZoneName::variants, name + "/") != std::end(ZoneName::variants) || name == "posixrules" ||
         name == "localtime";
}

void addCompiled(const SystemRoot& root, const std::string& below, int depth, Names& names) {
  const auto entries = root.list(ZoneName{below}.file());
  if (!entries || depth > deepestZone) return;
  for (const auto& entry : *entries) {
    if (isNoZone(entry)) continue;
    const auto name = below + entry;
    const auto file = root.read(ZoneName{name}.file(), largestZone);
    if (!file) addCompiled(root, name + "/", depth + 1, names);
    if (file && file->starts_with("TZif")) names.insert(name);
  }
}

}  // namespace

Result<std::vector<ZoneName>> installedZones(const SystemRoot& root) {
  Names names;
  if (const auto source = readTable(root, "tzdata.zi")) names = namesOfSource(*source);
  removeUninstalled(root, names);
  if (names.empty()) {
    if (const auto table = readTable(root, "zone1970.tab")) names = namesOfTable(*table);
    removeUninstalled(root, names);
  }
  if (names.empty()) addCompiled(root, "", 1, names);
  if (names.empty()) return Failure{"list time zones", std::string(ZoneName::folder), "no time zones are installed"};
  std::vector<ZoneName> zones;
  for (const auto& name : names)
    if (const ZoneName zone{name}; zone.fitsOneLine()) zones.push_back(zone);
  return zones;
}

}  // namespace tavisk
