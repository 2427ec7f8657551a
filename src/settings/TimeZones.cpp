// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <vector>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

std::string ServerCommands::localTimeZone() {
  std::string ofMachine = _context.host.clock().timeZone();
  return _timeZone.value_or(ofMachine);
}

void ServerCommands::getTimeZone() {
  _context.output.print("Time Zone: %s\n", localTimeZone().c_str());
  setError(false);
}

void ServerCommands::listTimeZones() {
  std::vector<std::string> names = _context.host.clock().knownTimeZones();
  std::ranges::sort(names, isListedBefore);
  _context.output.putLine("Time Zones:");
  for (const std::string& name : names) _context.output.print(" %s\n", name.c_str());
  setError(false);
}

void ServerCommands::setTimeZone(const std::string& timeZone) {
  ClockService& clock = _context.host.clock();
  const std::vector<std::string> names = clock.knownTimeZones();
  setError(false);
  if (checkForEmptyString(timeZone, "settimezone", "a valid time zone", "settimezone <timezone>")) return;
  if (std::ranges::find(names, timeZone) == names.end()) {
    _context.output.print(
        "%s is not a valid timezone. The command 'listtimezones' will show a list of valid time zones.\n",
        timeZone.c_str());
    setError(true);
    return;
  }
  clock.setTimeZone("/usr/share/zoneinfo/" + timeZone);
  _timeZone = timeZone;
  _context.output.print("Set TimeZone: %s\n", timeZone.c_str());
}

HandlerRows timeZoneHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getTimeZone", &ServerCommands::getTimeZone},
      {"listTimeZones", &ServerCommands::listTimeZones},
      {"setTimeZone:", &ServerCommands::setTimeZone},
  };
  return rows;
}

}  // namespace tavisk
