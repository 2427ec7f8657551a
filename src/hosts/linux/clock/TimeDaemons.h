// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/services/Daemons.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

using TimeServers = std::vector<std::string>;

/// A network-time daemon: how it is called and how it keeps its server.
struct TimeDaemon {
  Daemon daemon;
  const char* serverFile;  ///< the tool's own file for the server

  /// All that are configured and in use, the tool's own in front.
  Result<TimeServers> (*servers)(const SystemRoot& root);
  /// All that are configured in other files than the tool's own.
  Result<TimeServers> (*otherServers)(const SystemRoot& root);
  /// The contents of the server file.
  std::string (*serverLines)(const std::string& server);
  /// Whether the daemon would read the server file; null: it does.
  Support (*readsServerFile)(const SystemRoot& root) = nullptr;
  /// The program by which the running daemon reads its servers again, with its arguments; without one it is restarted.
  std::span<const char* const> reload = {};
  /// What tells whether the running daemon has read its servers since they were changed; of these a daemon has one.
  /// Where it tells its servers, and the one that it uses (org.freedesktop.timesync1(5)); null: nowhere.
  const char* busService = nullptr;
  /// The program, with its arguments, that prints a line of comma-separated fields for each server: the second is "*"
  /// for the one that it uses, the third the name as it was configured, the eighth the seconds by which the clock is
  /// ahead of it, by the last answer and what has been corrected since (chronyc(1)).
  std::span<const char* const> sources = {};
  /// The file that it writes each time it starts, before it reads its configuration; null: none.
  const char* startFile = nullptr;
};

/// Whether the servers that a running daemon goes by are those that are configured; true too where it never reads the
/// tool's file. Fails where that cannot be found out.
Result<bool> hasReadServers(const TimeDaemon& daemon, const LinuxMachine& machine);

/// The server that a running daemon uses at the moment: empty when it has found none yet, or does not tell. ntpsec and
/// openntpd are not asked.
Result<std::string> serverInUse(const TimeDaemon& daemon, const LinuxMachine& machine);

/// Where a running daemon has the time from.
struct TimeSource {
  std::string server;  ///< as serverInUse() tells it
  /// What the clock was at its last answer; absent: nobody tells.
  Result<std::optional<std::chrono::microseconds>> ahead = std::optional<std::chrono::microseconds>();
};
Result<TimeSource> sourceInUse(const TimeDaemon& daemon, const LinuxMachine& machine);

/// The daemons that this host knows, the preferred one first.
std::span<const TimeDaemon> timeDaemons();

}  // namespace tavisk
