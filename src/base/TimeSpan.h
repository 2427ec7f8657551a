// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <optional>
#include <string_view>

namespace tavisk {

/// What "infinity" is.
inline constexpr std::chrono::microseconds endlessTime = std::chrono::microseconds::max();

/// A length of time as the service manager's files have it (systemd.time(7)): "90", "15min", "1.5h", "1h 30min",
/// "infinity". A number without a unit is seconds. Absent when the text is nothing of the kind, or too long for the
/// type.
std::optional<std::chrono::microseconds> timeSpan(std::string_view text);

}  // namespace tavisk
