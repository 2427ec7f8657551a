// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Calendar.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstdlib>
#include <ctime>

namespace tavisk {
namespace {

constexpr std::int64_t secondsPerDay = 86'400;
constexpr std::int64_t daysPerEra = 146'097;  // 400 years
constexpr std::int64_t daysFromMarch0ToEpoch = 719'468;

std::int64_t floorDivided(std::int64_t dividend, std::int64_t divisor) {
  return dividend / divisor - (dividend % divisor < 0 ? 1 : 0);
}

std::int64_t floorRemainder(std::int64_t dividend, std::int64_t divisor) {
  return dividend - floorDivided(dividend, divisor) * divisor;
}

std::int64_t cut(std::int64_t value, std::int64_t most) {
  return std::clamp(value, -most, most);
}

/// Days from 1970-01-01 to the first day of a month. Years are counted from March, so that the leap day comes last.
std::int64_t dayOfMonthBegin(std::int64_t year, std::int64_t month) {
  const auto months = year * 12 + (month - 3);
  const auto marchYear = floorDivided(months, 12);
  const auto era = floorDivided(marchYear, 400);
  const auto yearOfEra = marchYear - era * 400;
  const auto dayOfYear = (153 * floorRemainder(months, 12) + 2) / 5;
  const auto dayOfEra = yearOfEra * 365 + yearOfEra / 4 - yearOfEra / 100 + dayOfYear;
  return era * daysPerEra + dayOfEra - daysFromMarch0ToEpoch;
}

/// The date of a day, counted from 1970-01-01, at midnight.
DateTime dateOf(std::int64_t day) {
  const auto era = floorDivided(day + daysFromMarch0ToEpoch, daysPerEra);
  const auto dayOfEra = day + daysFromMarch0ToEpoch - era * daysPerEra;
  const auto yearOfEra = (dayOfEra - dayOfEra / 1460 + dayOfEra / 36'524 - dayOfEra / 146'096) / 365;
  const auto dayOfYear = dayOfEra - (365 * yearOfEra + yearOfEra / 4 - yearOfEra / 100);
  const auto monthFromMarch = (5 * dayOfYear + 2) / 153;
  const auto month = monthFromMarch < 10 ? monthFromMarch + 3 : monthFromMarch - 9;
  return {era * 400 + yearOfEra + (month <= 2 ? 1 : 0), month, dayOfYear - (153 * monthFromMarch + 2) / 5 + 1};
}

/// The date and time as seconds, were it UTC.
std::int64_t secondsAsUtc(const DateTime& time) {
  constexpr std::int64_t mostYears = 10'000'000'000;
  constexpr std::int64_t most = 1'000'000'000'000;
  const auto day = dayOfMonthBegin(cut(time.year, mostYears), cut(time.month, most)) + cut(time.day, most) - 1;
  return day * secondsPerDay + cut(time.hour, most) * 3600 + cut(time.minute, most) * 60 + cut(time.second, most);
}

/// Seconds that the zone's clocks are ahead of UTC; 0 at times that the system library does not know.
std::int64_t offsetAt(std::int64_t secondsSince1970) {
  const std::time_t time = secondsSince1970;
  std::tm local{};
  return !localtime_r(&time, &local) ? 0 : local.tm_gmtoff;
}

/// The system library would wait for a FIFO to be written.
bool isRegular(const std::string& file) {
  struct stat status {};
  return ::stat(file.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

}  // namespace

void setDefaultTimeZone(const std::string& zoneFile) {
  const auto zone = isRegular(zoneFile) ? ":" + zoneFile : "UTC0";
  setenv("TZ", zone.c_str(), 1);  // NOLINT(concurrency-mt-unsafe): as declared
  tzset();
}

DateTime localDateTime(std::int64_t secondsSince1970) {
  constexpr std::int64_t most = std::int64_t{1} << 61U;
  const auto time = cut(secondsSince1970, most);
  const auto local = time + offsetAt(time);
  const auto secondOfDay = floorRemainder(local, secondsPerDay);
  auto result = dateOf(floorDivided(local, secondsPerDay));
  result.hour = secondOfDay / 3600;
  result.minute = secondOfDay / 60 % 60;
  result.second = secondOfDay % 60;
  return result;
}

double secondsSince1970(const DateTime& local) {
  const auto asUtc = secondsAsUtc(local);
  const auto offsetBefore = offsetAt(asUtc - secondsPerDay);
  const auto offsetAfter = offsetAt(asUtc + secondsPerDay);
  for (const auto offset : {offsetBefore, offsetAfter}) {
    if (offsetAt(asUtc - offset) == offset) return static_cast<double>(asUtc - offset);
  }
  return static_cast<double>(asUtc - offsetBefore);
}

}  // namespace tavisk
