// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LocalTime.h"

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"

namespace tavisk {
namespace {

constexpr const char* localTimeLink = "/etc/localtime";
constexpr const char* timeZoneFile = "/etc/timezone";
constexpr std::size_t timeZoneFileLimit = 4096;

}  // namespace

std::optional<ZoneName> timeZoneFileName(const SystemRoot& root) {
  const auto text = root.read(timeZoneFile, timeZoneFileLimit);
  if (!text) return std::nullopt;
  const auto lines = configurationLines(*text);
  return lines.empty() ? ZoneName() : ZoneName{split(lines.front(), " \t\r").front()};
}

std::optional<ZoneName> machineTimeZone(const SystemRoot& root) {
  if (const auto target = root.readLink(localTimeLink))
    if (auto zone = zoneOfPath(*target)) return zone;
  const auto zone = timeZoneFileName(root);
  return zone && zone->isWellFormed() ? zone : std::nullopt;
}

Result<void> linkLocalTime(const SystemRoot& root, const ZoneName& zone) {
  const auto file = zone.file();
  if (!zone.isWellFormed() || !root.exists(file)) return Failure{"set the time zone", file, "there is no such zone"};
  return root.writeLink(localTimeLink, ".." + file);
}

Result<void> updateTimeZoneFile(const SystemRoot& root, const ZoneName& zone) {
  if (!root.exists(timeZoneFile)) return {};
  return root.write(timeZoneFile, zone.text + "\n");
}

}  // namespace tavisk
