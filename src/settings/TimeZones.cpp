// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "base/Calendar.h"
#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

ZoneName ServerCommands::localTimeZone() const {
  const auto ofMachine = _context.host.clock().timeZone();
  return _timeZone.value_or(ofMachine);
}

void ServerCommands::getTimeZone() {
  _context.output.print("Time Zone: %s\n", localTimeZone().text.c_str());
  setError(false);
}

void ServerCommands::listTimeZones() {
  auto zones = _context.host.clock().knownTimeZones();
  std::ranges::sort(zones, isListedBefore, &ZoneName::text);
  _context.output.putLine("Time Zones:");
  for (const auto& zone : zones) _context.output.print(" %s\n", zone.text.c_str());
  setError(false);
}

void ServerCommands::setTimeZone(const std::string& timeZone) {
  auto& clock = _context.host.clock();
  const auto zones = clock.knownTimeZones();
  const ZoneName zone{timeZone};
  setError(false);
  if (checkForEmptyString(timeZone, "settimezone", "a valid time zone", "settimezone <timezone>")) return;
  if (std::ranges::find(zones, zone) == zones.end()) {
    _context.output.print(
        "%s is not a valid timezone. The command 'listtimezones' will show a list of valid time zones.\n",
        timeZone.c_str());
    refuse("a time zone that -listtimezones lists");
    setError(true);
    return;
  }
  clock.setTimeZone(zone);
  _timeZone = zone;
  setDefaultTimeZone(clock.rulesOf(zone));
  _context.output.print("Set TimeZone: %s\n", timeZone.c_str());
}

HandlerRows timeZonesHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getTimeZone", &ServerCommands::getTimeZone},
      {"listTimeZones", &ServerCommands::listTimeZones},
      {"setTimeZone:", &ServerCommands::setTimeZone},
  };
  return rows;
}

}  // namespace tavisk
