// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LocalTime.h"

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr const char* localTimeLink = "/etc/localtime";
constexpr const char* timeZoneFile = "/etc/timezone";
constexpr std::size_t timeZoneFileLimit = 4096;
constexpr std::size_t largestZone = std::size_t{1} << 20U;
constexpr const char* setZone = "set the time zone";

/// Where the link leads; absent too when a copy of a zone's file stands in its place.
Result<std::optional<std::string>> localTimeTarget(const SystemRoot& root) {
  const auto target = root.readLink(localTimeLink);
  const bool isNoLink = !target && !target.failure().code;
  return isNoLink ? Result<std::optional<std::string>>(std::nullopt) : orAbsent(target);
}

}  // namespace

Result<std::optional<ZoneName>> timeZoneFileName(const SystemRoot& root) {
  const auto text = orAbsent(root.read(timeZoneFile, timeZoneFileLimit));
  if (!text) return text.failure();
  if (!*text) return std::optional<ZoneName>();
  const auto lines = configurationLines(**text);
  return std::optional(lines.empty() ? ZoneName() : ZoneName{split(lines.front(), " \t\r").front()});
}

Result<std::optional<ZoneName>> machineTimeZone(const SystemRoot& root) {
  const auto target = localTimeTarget(root);
  if (!target) return target.failure();
  if (auto zone = zoneOfPath(target->value_or(""))) return zone;
  auto zone = timeZoneFileName(root);
  if (zone && *zone && !(*zone)->isWellFormed()) return std::optional<ZoneName>();
  return zone;
}

std::optional<Failure> whyNoZone(const SystemRoot& root, const ZoneName& zone) {
  const auto file = zone.file();
  if (!zone.isWellFormed()) return Failure{setZone, file, "there is no such zone"};
  const auto rules = root.read(file, largestZone);
  if (!rules) return isAbsent(rules.failure()) ? Failure{setZone, file, "there is no such zone"} : rules.failure();
  if (!rules->starts_with("TZif")) return Failure{setZone, file, "it holds no time zone"};
  return std::nullopt;
}

std::optional<Failure> whyZoneNeedsRoot(const SystemRoot& root, const ZoneName& zone) {
  const auto named = timeZoneFileName(root);
  if (!named) return named.failure();
  return *named && **named != zone ? whyNeedsRoot(setZone, timeZoneFile) : std::nullopt;
}

Result<void> linkLocalTime(const SystemRoot& root, const ZoneName& zone) {
  return root.writeLink(localTimeLink, ".." + zone.file());
}

Result<void> updateTimeZoneFile(const SystemRoot& root, const ZoneName& zone) {
  const auto named = timeZoneFileName(root);
  if (!named) return named.failure();
  if (!*named || **named == zone) return {};
  return root.write(timeZoneFile, zone.text + "\n");
}

}  // namespace tavisk
