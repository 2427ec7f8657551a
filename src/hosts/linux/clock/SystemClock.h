// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <utility>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Seconds since 1970-01-01 00:00:00 UTC.
std::int64_t systemTime();

/// Why Linux would refuse this time (clock_settime(2)): before 1970, after April 2232, or before the machine's own
/// start as it counts it. Absent when it would not.
std::optional<Failure> whyOutOfClockRange(std::int64_t secondsSince1970);

/// Whether this process may set the clock (CAP_SYS_TIME, capabilities(7)).
bool maySetSystemTime();

/// Whether nothing on this machine may: its first process cannot pass the right on to any other (proc(5), CapBnd).
/// False also where that cannot be read.
bool mayNobodySetSystemTime(const SystemRoot& root);
/// Sets the kernel's clock, of the whole machine.
Result<void> setSystemTime(std::chrono::microseconds since1970);

/// What the kernel knows of a clock that is kept right (adjtimex(2)).
struct ClockDiscipline {
  std::chrono::microseconds largestError;  ///< by which it may be off
};

/// Absent while nothing keeps the clock right.
Result<std::optional<ClockDiscipline>> clockDiscipline();

/// Where the machine keeps the time while it is off.
inline constexpr const char* hardwareClock = "/dev/rtc0";

/// What the hardware clock says, in seconds since 1970 UTC whichever time it keeps; absent when the machine has none.
Result<std::optional<std::int64_t>> hardwareTime(const SystemRoot& root);

/// A time to which the clocks are set, asked for at the moment in which this object is made; and what they said at that
/// moment, however much later they are read. From isSet() on, what is as near as a clock is set and read is the time
/// itself, and a clock that has only gone on says what it said at the first look.
class AskedTime {
 public:
  explicit AskedTime(std::int64_t secondsSince1970) : _seconds(secondsSince1970) {}
  /// The clocks have been set, or could not be.
  void isSet() { _isSet = true; }

  std::int64_t seconds() const { return _seconds; }
  /// Since 1970: the time, and what has passed since it was asked for.
  std::chrono::microseconds now() const;
  /// By how much the system clock has to be put forward, or back.
  std::int64_t microsecondsAhead() const;
  std::int64_t onSystemClock();
  /// Absent when the machine has none.
  Result<std::optional<std::int64_t>> onHardwareClock(const SystemRoot& root);

 private:
  using Look = std::chrono::microseconds;
  std::chrono::microseconds sinceThen() const;
  std::int64_t told(std::chrono::microseconds shown, std::chrono::seconds near, std::optional<Look>& first) const;

  std::int64_t _seconds;
  std::chrono::steady_clock::time_point _moment = std::chrono::steady_clock::now();
  bool _isSet = false;
  std::optional<Look> _system;    ///< the first at that clock
  std::optional<Look> _hardware;  ///< the first at that clock
};

/// The hardware clock (rtc(4)), which keeps local time when /etc/adjtime says so (adjtime_config(5)).
class HardwareClock {
 public:
  /// Absent when the machine has none.
  static Result<std::optional<HardwareClock>> open(const SystemRoot& root);
  Result<void> set(std::int64_t secondsSince1970) const;

 private:
  HardwareClock(FileDescriptor device, bool isLocal) : _device(std::move(device)), _isLocal(isLocal) {}

  FileDescriptor _device;
  bool _isLocal;
};

}  // namespace tavisk
