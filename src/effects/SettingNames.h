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
inline constexpr const char* computerSleep = "Computer Sleep";
inline constexpr const char* displaySleep = "Display Sleep";
inline constexpr const char* hardDiskSleep = "Hard Disk Sleep";
inline constexpr const char* wakeOnModem = "Wake On Modem";
inline constexpr const char* wakeOnNetworkAccess = "Wake On Network Access";
inline constexpr const char* restartAfterPowerFailure = "Restart After Power Failure";
inline constexpr const char* restartAfterFreeze = "Restart After Freeze";
inline constexpr const char* powerButtonSleep = "Power Button Sleep";
inline constexpr const char* startupDelay = "Startup Delay";
inline constexpr const char* remoteLogin = "Remote Login";
inline constexpr const char* remoteEvents = "Remote Events";
inline constexpr const char* computerName = "Computer Name";
inline constexpr const char* localSubnetName = "Local Subnet Name";
inline constexpr const char* dynamicStore = "Dynamic Store";
inline constexpr const char* kernelArchitecture = "Kernel Architecture";
inline constexpr const char* keyboardLock = "Keyboard Lock";
inline constexpr const char* keyboardLockPreference = "Keyboard Lock Preference";
inline constexpr const char* preferencesWrite = "Preferences Write";
inline constexpr const char* signalToProcess = "Signal To Process";
inline constexpr const char* startupDisk = "Startup Disk";
/// A look at the machine's files that failed while startup disks were looked for, and the like.
inline constexpr const char* files = "Files";
inline constexpr const char* networkStartupDisk = "Network Startup Disk";
/// Before the name of a firmware variable: "Firmware Variable prev-lang:kbd".
inline constexpr const char* firmwareVariable = "Firmware Variable ";

}  // namespace tavisk::setting
