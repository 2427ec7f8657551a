// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

#include "platform/Result.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// Seconds since 1970-01-01 00:00:00 UTC.
std::int64_t systemTime();

/// Why Linux would refuse this time (clock_settime(2)): before 1970, after April 2232, or before the machine's own
/// start as it counts it. Absent when it would not.
std::optional<Failure> whyOutOfClockRange(std::int64_t secondsSince1970);

/// Whether this process may set the clock (CAP_SYS_TIME, capabilities(7)).
bool maySetSystemTime();

/// Sets the kernel's clock, of the whole machine.
Result<void> setSystemTime(std::int64_t secondsSince1970);

/// Where the machine keeps the time while it is off.
inline constexpr const char* hardwareClock = "/dev/rtc0";

/// Sets the hardware clock (rtc(4)), to local time when /etc/adjtime says so (adjtime_config(5)). A machine that has
/// none is a success.
Result<void> setHardwareClock(const SystemRoot& root, std::int64_t secondsSince1970);

}  // namespace tavisk
