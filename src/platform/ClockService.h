// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace tavisk {

/// The system clock and its time zone. Results of the setters go to the effects, not to the caller.
class ClockService {
 public:
  virtual ~ClockService() = default;

  /// Seconds since 1970-01-01 00:00:00 UTC.
  virtual std::int64_t now() = 0;
  virtual void setTime(std::int64_t secondsSince1970) = 0;

  /// Names of the time-zone database ("Europe/Paris"), in no particular order; empty when the host has none.
  virtual std::vector<std::string> knownTimeZones() = 0;
  /// "UTC" when the machine has no zone.
  virtual std::string timeZone() = 0;
  /// `zoneFile` is "/usr/share/zoneinfo/" and the name.
  virtual void setTimeZone(const std::string& zoneFile) = 0;
  /// The compiled zone file (absolute path on the machine that runs the tool) with the rules of a zone.
  virtual std::string rulesOf(const std::string& timeZone) = 0;
};

}  // namespace tavisk
