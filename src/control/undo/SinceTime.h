// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace tavisk::control {

/// A time as journalctl(1) takes it after --since, in the process's time zone: "2026-11-22 14:30", with seconds or
/// without the time of day, "14:30" today, "today", "yesterday", "now", "@" and seconds since 1970, "-2h" and "2 hours
/// ago" (see timeSpan()). Both are seconds since 1970 UTC. Absent when the text is none of them.
std::optional<std::int64_t> timeMeantBy(const std::string& text, std::int64_t now);

}  // namespace tavisk::control
