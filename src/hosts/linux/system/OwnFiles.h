// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

/// The files that the tool writes for itself alone among those of other packages. All of them are taken away when the
/// package is purged.
namespace tavisk::ownfile {

/// The first line of each.
inline constexpr const char* header = "# Written by tavisk. Changes made here are replaced.\n";
/// The beginning of their names.
inline constexpr const char* name = "60-tavisk";

inline constexpr const char* chronyServer = "/etc/chrony/sources.d/60-tavisk.sources";
inline constexpr const char* ntpsecServer = "/etc/ntpsec/ntp.d/60-tavisk.conf";
inline constexpr const char* timesyncdServer = "/etc/systemd/timesyncd.conf.d/60-tavisk.conf";
inline constexpr const char* timeServers[] = {chronyServer, ntpsecServer, timesyncdServer};
/// Written to the console at each start (tmpfiles.d(5), "w").
inline constexpr const char* consoleBlanking = "/etc/tmpfiles.d/60-tavisk.conf";
inline constexpr const char* kernelPanic = "/etc/sysctl.d/60-tavisk.conf";

/// Held while a setting is changed (MachineLock).
inline constexpr const char* machineLockFolder = "/run/tavisk";
inline constexpr const char* machineLock = "/run/tavisk/lock";

/// While a reset is under way (ResetMark). After a restart what is stored is in force in any case.
inline std::string resetMark(const std::string& setting) {
  return "/run/tavisk/resets/" + setting;
}

/// Beside the main file of one of the service manager's daemons: "timesyncd.conf".
inline std::string systemdDropIn(const std::string& mainFile) {
  return "/etc/systemd/" + mainFile + ".d/60-tavisk.conf";
}
/// Beside a file of systemd.link(5): "99-default.link".
inline std::string linkDropIn(const std::string& linkFile) {
  return "/etc/systemd/network/" + linkFile + ".d/60-tavisk.conf";
}
/// `setting` is part of the name: "disk-sleep".
inline std::string udevRule(const std::string& setting) {
  return "/etc/udev/rules.d/60-tavisk-" + setting + ".rules";
}

}  // namespace tavisk::ownfile
