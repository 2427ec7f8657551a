// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LocalTime.h"

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

constexpr std::size_t timeZoneFileLimit = 4096;
constexpr std::size_t largestZone = std::size_t{1} << 20U;
constexpr const char* setZone = "set the time zone";

/// Where the link leads; absent too when a copy of a zone's file stands in its place.
Result<std::optional<std::string>> localTimeTarget(const SystemRoot& root) {
  const auto target = root.readLink(localTimeLink);
  const bool isNoLink = !target && !target.failure().code;
  return isNoLink ? Result<std::optional<std::string>>(std::nullopt) : orAbsent(target);
}

/// A failure without a code is that of what is no zone: a folder, or too large.
Result<bool> hasRules(const SystemRoot& root, const ZoneName& zone, const std::string& rules) {
  const auto its = orAbsent(root.read(zone.file(), largestZone));
  if (!its && its.failure().code) return its.failure();
  return its && *its == rules;
}

/// As the second copy of the name says; UTC where that names none.
Result<ZoneName> nameBeside(const SystemRoot& root) {
  const auto named = timeZoneFileName(root);
  if (!named) return named.failure();
  return *named && (*named)->isWellFormed() ? **named : utc();
}

Result<Reading<ZoneName>> zoneWithRules(const SystemRoot& root, const std::string& rules) {
  const auto named = nameBeside(root);
  if (!named) return named.failure();
  const auto installed = orEmpty(installedZones(root));
  if (!installed) return installed.failure();
  auto candidates = *installed;
  candidates.insert(candidates.begin(), *named);
  for (const auto& zone : candidates) {
    const auto isIt = hasRules(root, zone, rules);
    if (!isIt) return isIt.failure();
    if (*isIt) return Reading(zone, zone.text + ", by the rules in " + localTimeLink);
  }
  return Reading(*named, std::string("rules of no known zone in ") + localTimeLink);
}

}  // namespace

Result<std::optional<ZoneName>> timeZoneFileName(const SystemRoot& root) {
  const auto text = orAbsent(root.read(timeZoneFile, timeZoneFileLimit));
  if (!text) return text.failure();
  if (!*text) return std::optional<ZoneName>();
  const auto lines = configurationLines(**text);
  return std::optional(lines.empty() ? ZoneName() : ZoneName{split(lines.front(), " \t\r").front()});
}

Result<std::optional<ZoneName>> linkedTimeZone(const SystemRoot& root) {
  const auto target = localTimeTarget(root);
  if (!target) return target.failure();
  return zoneOfPath(target->value_or(""));
}

Result<Reading<ZoneName>> timeZoneInForce(const SystemRoot& root) {
  const auto linked = linkedTimeZone(root);
  if (!linked) return linked.failure();
  const auto rules = orAbsent(root.read(localTimeLink, largestZone));
  if (*linked && rules && !*rules) return Reading(**linked, "UTC, without " + (*linked)->file());
  if (*linked) return Reading(**linked);
  if (!rules) return rules.failure();
  return *rules ? zoneWithRules(root, **rules) : Reading(utc());
}

namespace {

/// The zone of a link, which may name none, with the second copy of the name where that is another.
Result<std::optional<Reading<ZoneName>>> linkedZoneBeside(const SystemRoot& root, const std::optional<ZoneName>& linked,
                                                          const std::optional<ZoneName>& second) {
  const auto found = linked ? Result<Reading<ZoneName>>(Reading(*linked)) : timeZoneInForce(root);
  if (!found) return found.failure();
  auto stored = *found;
  if (second && *second != stored.value)
    stored.detail =
        change::textOfReading(stored) + ", " + (second->text.empty() ? "none" : second->text) + " in " + timeZoneFile;
  return std::optional(std::move(stored));
}

}  // namespace

Result<std::optional<Reading<ZoneName>>> storedTimeZone(const SystemRoot& root) {
  const auto target = localTimeTarget(root);
  if (!target) return target.failure();
  const auto second = timeZoneFileName(root);
  if (!second) return second.failure();
  if (*target) return linkedZoneBeside(root, zoneOfPath(**target), *second);
  if (*second) return std::optional(Reading(**second));
  const auto there = root.isThere(localTimeLink);
  if (!there) return there.failure();
  if (*there) return timeZoneInForce(root);
  return std::optional<Reading<ZoneName>>();
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

Result<bool> updateTimeZoneFile(const SystemRoot& root, const ZoneName& zone) {
  const auto named = timeZoneFileName(root);
  if (!named) return named.failure();
  if (!*named || **named == zone) return false;
  const auto written = root.write(timeZoneFile, zone.text + "\n");
  if (!written) return written.failure();
  return true;
}

}  // namespace tavisk
