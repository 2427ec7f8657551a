// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/WrittenPlaces.h"

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

  /// Of each, in the same order; one that cannot be told is a failure of all.
  virtual Result<std::vector<Presence>> presences(const std::vector<Daemon>& daemons) = 0;
  Result<Presence> presence(const Daemon& daemon);
  /// As presences(): also while it starts.
  virtual Result<std::vector<bool>> areRunning(const std::vector<Daemon>& daemons) = 0;
  Result<bool> isRunning(const Daemon& daemon);
  /// Whether it starts or stops at this moment: isRunning() then tells what is to be rather than what is.
  virtual Result<bool> isChanging(const Daemon& daemon) = 0;
  /// Whether it will run after the machine has been started again.
  virtual Result<bool> startsAtBoot(const Daemon& daemon) = 0;
  /// Whether the machine was told to start it until it is started again, and no longer.
  virtual Result<bool> startsUntilRestart(const Daemon& daemon) = 0;
  /// Whether it does not start at boot and could: what cannot be enabled, as what another brings with it, does neither.
  virtual Result<bool> staysOffAtBoot(const Daemon& daemon) = 0;
  /// One after the other; the first failure ends it. Only root may; whoever is not is refused before anything changes.
  /// The links that are made and removed are added to `written`.
  virtual Result<void> setStartAtBoot(const std::vector<Daemon>& daemons, bool start, WrittenPlaces& written) = 0;
  /// Why setStartAtBoot() would refuse, asked of each before anything changes: one is masked, or the caller is not
  /// root.
  Result<void> checkSetStartAtBoot(const std::vector<Daemon>& daemons, bool start);
  /// Why start() would fail, as far as that shows beforehand: it is masked, or a condition of it does not hold.
  virtual Result<void> foreseeStart(const Daemon& daemon);
  /// Success means that the daemon runs: one that was started and ended at once, or never began, is a failure.
  virtual Result<void> start(const Daemon& daemon) = 0;
  virtual Result<void> stop(const Daemon& daemon) = 0;
  /// Success means that it has ended and started again.
  virtual Result<void> restart(const Daemon& daemon) = 0;
  /// A daemon that does not run stays so. Returns without waiting for the restart to end.
  virtual Result<void> restartIfRunning(const Daemon& daemon) = 0;

  /// Asked before a daemon is started or stopped that is to start at boot or no longer to: fails where setStartAtBoot()
  /// would have something to change and the caller is not root.
  Result<void> checkMayStartAtBoot(const Daemon& daemon, bool start);
};

/// Daemons that belong together, such as a service and the socket that starts it, the most important one first.
class DaemonGroup {
 public:
  /// `daemons` must outlive the object, and so must the texts of the members.
  DaemonGroup(Daemons& daemons, std::vector<Daemon> members) : _daemons(daemons), _members(std::move(members)) {}
  /// Daemons that have no name but that of their unit.
  DaemonGroup(Daemons& daemons, std::vector<std::string> units);

  const std::vector<Daemon>& members() const { return _members; }
  /// "ssh.service, ssh.socket"
  std::string names() const;

  /// Those that this machine has, also if they are masked.
  Result<DaemonGroup> present() const;
  Result<std::vector<Daemon>> running() const;
  Result<std::vector<Daemon>> startingAtBoot() const;
  Result<bool> isAnyRunning() const;
  /// The others are not asked about after the first that does.
  Result<bool> isAnyStartingAtBoot() const;
  Result<std::vector<Daemon>> stayingOffAtBoot() const;
  /// Those that run, and services that wait for their socket, a member that listens, to start them.
  Result<std::vector<Daemon>> ready() const;

  /// Whether a member starts or stops at this moment.
  Result<bool> isChanging() const;

  /// The members that are not so already.
  Result<std::vector<Daemon>> toSetAtBoot(bool start) const;
  /// Each of them; the first failure ends it.
  Result<void> setAllStartAtBoot(bool start, WrittenPlaces& written) const;
  /// Why startAll() would fail.
  Result<void> foreseeStartAll() const;
  /// Those that are not ready, sockets first: a socket is not started beside its running service.
  Result<void> startAll() const;
  /// Sockets first, so that none starts its service again, and the last one first.
  Result<void> stopAll() const;

 private:
  Result<bool> isReady(const Daemon& member) const;
  Result<std::vector<Daemon>> those(const std::function<Result<bool>(const Daemon&)>& are) const;

  Daemons& _daemons;
  std::shared_ptr<const std::vector<std::string>> _units;  ///< keeps the texts
  std::vector<Daemon> _members;
};

}  // namespace tavisk
