// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

namespace tavisk {

/// A date and a time of day in the process's default time zone, in the Gregorian calendar (proleptic before 1582).
struct DateTime {
  std::int64_t year = 1970;  ///< of the common era
  std::int64_t month = 1;    ///< 1 to 12
  std::int64_t day = 1;      ///< of the month, from 1
  std::int64_t hour = 0;     ///< 0 to 23
  std::int64_t minute = 0;
  std::int64_t second = 0;

  bool operator==(const DateTime&) const = default;
};

/// Makes a zone the default of this process, by the absolute path of its compiled file (tzfile(5)); a file that cannot
/// be used means UTC. Nothing else decides the zone: TZ of the environment is replaced. Not while another thread reads
/// the environment or asks for a local time.
void setDefaultTimeZone(const std::string& zoneFile);

/// Seconds since 1970-01-01 00:00:00 UTC as a local date and time.
DateTime localDateTime(std::int64_t secondsSince1970);

/// The other way. Components out of range are carried into the next larger unit (hour 24 is the next day's midnight,
/// 2/31 is in March). A local time that a change of the offset leaves out moves forward by the gap; of one that happens
/// twice the first is meant. Fractions of a second do not occur, but the result is a floating-point interval, as
/// callers expect it. Components of absurd size are cut to what 64 bits can count.
double secondsSince1970(const DateTime& local);

}  // namespace tavisk
