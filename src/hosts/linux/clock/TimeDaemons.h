// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>

#include "base/Result.h"
#include "hosts/linux/services/Daemons.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A network-time daemon: how it is called and how it keeps its server.
struct TimeDaemon {
  Daemon daemon;
  const char* serverFile;  ///< the tool's own file for the server

  /// The server that comes first: the tool's own, else the first one configured; empty when there is none.
  Result<std::string> (*server)(const SystemRoot& root);
  /// The first server that stays in use beside the tool's own; null: the tool's own takes the place of all others.
  Result<std::string> (*otherServer)(const SystemRoot& root) = nullptr;
  /// The contents of the server file.
  std::string (*serverLines)(const std::string& server);
  /// Whether the daemon would read the server file; null: it does.
  Support (*readsServerFile)(const SystemRoot& root) = nullptr;
  /// The program by which the running daemon reads its servers again, with its arguments; without one it is restarted.
  std::span<const char* const> reload = {};
  /// Where the running daemon tells which server it uses when none is configured (org.freedesktop.timesync1(5)); null:
  /// it uses none then.
  const char* busService = nullptr;
};

/// The daemons that this host knows, the preferred one first.
std::span<const TimeDaemon> timeDaemons();

}  // namespace tavisk
