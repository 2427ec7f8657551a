// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>

#include "base/Calendar.h"
#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"
#include "settings/LeadingNumber.h"

namespace tavisk {
namespace {

constexpr const char* dates = "a date as mm:dd:yy";
constexpr const char* times = "a time as hh:mm:ss";

/// The three numbers of "mm:dd:yy" or "hh:mm:ss"; what is missing or no number is 0.
std::array<std::int64_t, 3> readFields(const std::string& text) {
  const auto fields = split(text, "/:");
  std::array<std::int64_t, 3> numbers{};
  for (std::size_t i = 0; i < numbers.size() && i < fields.size(); ++i) numbers[i] = leadingInteger(fields[i]);
  return numbers;
}

/// What is missing is taken for 0, and so is what is no number.
bool areNumbers(const std::string& text) {
  const auto fields = split(text, "/:");
  return !fields.empty() && std::ranges::all_of(fields, &beginsWithNumber);
}

/// Compared without a sign, so that no negative number is at most `limit`.
bool isAtMost(std::int64_t number, std::uint64_t limit) {
  return static_cast<std::uint64_t>(number) <= limit;
}

bool isTime(std::int64_t hour, std::int64_t minute, std::int64_t second) {
  return isAtMost(hour, 24) && isAtMost(minute, 59) && isAtMost(second, 59) &&
         (hour != 24 || (minute == 0 && second == 0));
}

bool isDate(std::int64_t month, std::int64_t day, std::int64_t year) {
  return month != 0 && isAtMost(month, 12) && day != 0 && isAtMost(day, 31) && isAtMost(year, 9999);
}

DateTime localNow(const ServerCommands& commands) {
  auto& clock = commands.context().host.clock();
  setDefaultTimeZone(clock.rulesOf(commands.localTimeZone()));
  return localDateTime(clock.now());
}

void setClock(const ServerCommands& commands, const DateTime& local) {
  commands.context().host.clock().setTime(static_cast<std::int64_t>(std::trunc(secondsSince1970(local))));
}

/// True while the network time client runs: then the error was printed and the error flag set.
bool refuseWhileNetworkTimeRuns(ServerCommands& commands, const char* error) {
  if (!commands.context().host.networkTime().isRunning()) return false;
  commands.context().output.print("%s", error);
  commands.context().output.putLine("Use '-setusingnetworktime' to turn network time off.");
  commands.refuse("a clock that network time does not set");
  commands.setError(true);
  return true;
}

}  // namespace

void ServerCommands::getDate() {
  const auto now = localNow(*this);
  _context.output.print("Date: %ld/%ld/%ld\n", now.month, now.day, now.year);
  setError(false);
}

void ServerCommands::setDate(const std::string& date) {
  if (refuseWhileNetworkTimeRuns(*this, "setDate: Error, you cannot set the date while network time is running. "))
    return;
  if (checkForEmptyString(date, "setdate", "a valid date", "setdate <mm:dd:yy>")) return;
  setError(false);
  const auto [month, day, yearAsTyped] = readFields(date);
  if (!isDate(month, day, yearAsTyped)) {
    _context.output.print("setdate: Error: %s is invalid date format... use mm:dd:yy\n", date.c_str());
    refuse(dates);
    setError(true);
    return;
  }
  if (!areNumbers(date)) refuse(dates);
  const std::int64_t year = yearAsTyped <= 99 ? yearAsTyped + 2000 : yearAsTyped;
  const auto now = localNow(*this);
  setClock(*this, {year, month, day, now.hour, now.minute, now.second});
  _context.output.print("setdate: %02ld/%02ld/%02ld\n", month, day, year);
}

void ServerCommands::getTime() {
  const auto now = localNow(*this);
  _context.output.print("Time: %02ld:%02ld:%02ld\n", now.hour, now.minute, now.second);
  setError(false);
}

void ServerCommands::setTime(const std::string& time) {
  if (refuseWhileNetworkTimeRuns(*this, "settime: Error, you cannot set time while network time is running. ")) return;
  if (checkForEmptyString(time, "settime", "a valid time", "settime <hh:mm:ss>")) return;
  setError(false);
  const auto [hour, minute, second] = readFields(time);
  if (!isTime(hour, minute, second)) {
    _context.output.print("settime: Error, %s is invalid time format... use hh:mm:ss\n", time.c_str());
    refuse(times);
    setError(true);
    return;
  }
  if (!areNumbers(time)) refuse(times);
  const auto now = localNow(*this);
  setClock(*this, {now.year, now.month, now.day, hour, minute, second});
  _context.output.print("Set Time: %02ld:%02ld:%02ld\n", hour, minute, second);
}

HandlerRows dateAndTimeHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getDate", &ServerCommands::getDate},
      {"setDate:", &ServerCommands::setDate},
      {"getTime", &ServerCommands::getTime},
      {"setTime:", &ServerCommands::setTime},
  };
  return rows;
}

}  // namespace tavisk
