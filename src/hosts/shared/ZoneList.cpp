// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/ZoneList.h"

#include <algorithm>
#include <set>
#include <string_view>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t largestTable = 4U << 20U;
constexpr std::size_t largestZone = 1U << 20U;
constexpr int deepestZone = 4;  // "America/Argentina/Buenos_Aires" needs 3

using Names = std::set<std::string>;

/// Empty where there is none.
Result<std::string> readTable(const SystemRoot& root, const char* name) {
  return orEmpty(root.read(ZoneName{name}.file(), largestTable));
}

template <typename Use>
void forEachLine(std::string_view text, Use use) {
  while (!text.empty()) {
    const auto line = text.substr(0, text.find('\n'));
    text.remove_prefix(std::min(line.size() + 1, text.size()));
    use(line);
  }
}

Names namesOfSource(std::string_view text) {
  Names names;
  forEachLine(text, [&](std::string_view line) {
    if (!line.starts_with('Z') && !line.starts_with('L')) return;
    const auto fields = split(line, " \t");
    if (fields.size() > 1 && fields[0] == "Z") names.insert(fields[1]);
    if (fields.size() > 2 && fields[0] == "L") names.insert(fields[2]);
  });
  return names;
}

Names namesOfTable(std::string_view text) {
  Names names;
  if (!text.empty()) names.insert("UTC");
  forEachLine(text, [&](std::string_view line) {
    const auto fields = split(line, " \t");
    if (fields.size() > 2 && !fields[0].starts_with('#')) names.insert(fields[2]);
  });
  return names;
}

/// Those that have a file: the source and the table also name zones that a package of their own brings.
Result<Names> installedOf(const SystemRoot& root, const Names& names) {
  std::vector<std::string> files;
  for (const auto& name : names) {
    if (const ZoneName zone{name}; zone.isWellFormed()) files.push_back(zone.file());
  }
  const auto there = root.thoseThere(std::move(files));
  if (!there) return there.failure();
  Names installed;
  for (const auto& file : *there) installed.insert(installed.end(), file.substr(ZoneName::folder.size()));
  return installed;
}

/// Other trees of the same zones, and files that are no zones.
bool isNoZone(const std::string& name) {
  return std::ranges::find(ZoneName::variants, name + "/") != std::end(ZoneName::variants) || name == "posixrules" ||
         name == "localtime";
}

/// A failure without a code is that of a file which is no zone: it is not a regular one, or too large.
Result<bool> isCompiledZone(const SystemRoot& root, const std::string& name) {
  const auto file = root.read(ZoneName{name}.file(), largestZone);
  if (!file && file.failure().code && !isAbsent(file.failure())) return file.failure();
  return file && file->starts_with("TZif");
}

Result<void> addCompiled(const SystemRoot& root, const std::string& below, int depth, Names& names) {
  const auto entries = orEmpty(root.list(ZoneName{below}.file()));
  if (!entries) return entries.failure();
  for (const auto& entry : *entries) {
    const auto name = below + entry;
    if (isNoZone(entry) || !ZoneName{name}.isWellFormed()) continue;
    const auto isZone = isCompiledZone(root, name);
    if (!isZone) return isZone.failure();
    if (*isZone) names.insert(name);
    if (*isZone || depth == deepestZone) continue;
    if (auto added = addCompiled(root, name + "/", depth + 1, names); !added) return added;
  }
  return {};
}

Result<Names> compiledZones(const SystemRoot& root) {
  Names names;
  const auto added = addCompiled(root, "", 1, names);
  if (!added) return added.failure();
  return names;
}

Result<Names> zonesNamedBy(const SystemRoot& root, const char* table, Names (*namesOf)(std::string_view text)) {
  const auto text = readTable(root, table);
  if (!text) return text.failure();
  return installedOf(root, namesOf(*text));
}

Result<Names> namesOfZones(const SystemRoot& root) {
  auto names = zonesNamedBy(root, "tzdata.zi", namesOfSource);
  if (names && names->empty()) names = zonesNamedBy(root, "zone1970.tab", namesOfTable);
  return names && names->empty() ? compiledZones(root) : names;
}

}  // namespace

Result<std::vector<ZoneName>> installedZones(const SystemRoot& root) {
  const auto names = namesOfZones(root);
  if (!names) return names.failure();
  if (names->empty())
    return Failure{"list time zones", std::string(ZoneName::folder), "no time zones are installed",
                   std::make_error_code(std::errc::no_such_file_or_directory)};
  std::vector<ZoneName> zones;
  for (const auto& name : *names) zones.push_back({name});
  return zones;
}

}  // namespace tavisk
