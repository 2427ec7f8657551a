// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

/// The names by which effects, reports and the scratch machine's "Refusals" call the settings.
namespace tavisk::setting {

inline constexpr const char* authorization = "Authorization";
inline constexpr const char* time = "Time";
inline constexpr const char* timeZone = "Time Zone";
inline constexpr const char* knownTimeZones = "Known Time Zones";
inline constexpr const char* networkTime = "Network Time";
inline constexpr const char* networkTimeAtStartup = "Network Time At Startup";
inline constexpr const char* networkTimeServer = "Network Time Server";
inline constexpr const char* networkTimeRestart = "Network Time Restart";

}  // namespace tavisk::setting
