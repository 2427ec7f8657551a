// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "platform/Result.h"

namespace tavisk {

/// A daemon by its three names: the service manager's, the init script's (empty: it has none), the program's.
struct Daemon {
  const char* unit;
  const char* script;
  const char* program;
  /// Where the program writes its process id, when others of its name are no daemons; else empty.
  const char* processFile = "";
};

/// Starts and stops daemons, now and at every start of the machine.
class Daemons {
 public:
  enum class Presence { absent, masked, installed };
  virtual ~Daemons() = default;

  virtual Result<Presence> presence(const Daemon& daemon) = 0;
  virtual Result<bool> isRunning(const Daemon& daemon) = 0;
  virtual Result<bool> startsAtBoot(const Daemon& daemon) = 0;
  /// One after the other; the first failure ends it.
  virtual Result<void> setStartAtBoot(const std::vector<Daemon>& daemons, bool start) = 0;
  /// Success means that the daemon runs: one that was started and ended at once, or never began, is a failure.
  virtual Result<void> start(const Daemon& daemon) = 0;
  virtual Result<void> stop(const Daemon& daemon) = 0;
  /// Success means that it has ended and started again.
  virtual Result<void> restart(const Daemon& daemon) = 0;
  /// A daemon that does not run stays so. Returns without waiting for the restart to end.
  virtual Result<void> restartIfRunning(const Daemon& daemon) = 0;
};

}  // namespace tavisk
