// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "base/RunLoop.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/services/Daemons.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

class ServiceAccess;

/// A unit as systemctl(1) lists it, in words such as "loaded" and "active".
struct UnitState {
  std::string load;
  std::string active;
  std::string job;  ///< the kind of the one that it has, empty without any
};

/// Daemons of a machine with the service manager: its units, and the links by which they start
/// (org.freedesktop.systemd1, see org.freedesktop.systemd1(5)).
class UnitDaemons final : public Daemons {
 public:
  /// All must outlive the object.
  UnitDaemons(ServiceAccess& services, const SystemRoot& root, RunLoop& runLoop)
      : _services(services), _root(root), _runLoop(runLoop) {}

  Result<std::vector<Presence>> presences(const std::vector<Daemon>& daemons) override;
  Result<std::vector<bool>> areRunning(const std::vector<Daemon>& daemons) override;
  Result<bool> isChanging(const Daemon& daemon) override;
  Result<bool> startsAtBoot(const Daemon& daemon) override;
  Result<bool> startsUntilRestart(const Daemon& daemon) override;
  Result<bool> staysOffAtBoot(const Daemon& daemon) override;
  Result<void> setStartAtBoot(const std::vector<Daemon>& daemons, bool start, WrittenPlaces& written) override;
  Result<void> foreseeStart(const Daemon& daemon) override;
  Result<void> start(const Daemon& daemon) override;
  Result<void> stop(const Daemon& daemon) override;
  Result<void> restart(const Daemon& daemon) override;
  Result<void> restartIfRunning(const Daemon& daemon) override;

 private:
  /// Asks the manager about a unit.
  Result<BusMessage> ask(const Daemon& daemon, const char* member, const char* replySignature);
  /// Has the manager change something about a unit.
  template <typename... Arguments>
  Result<BusMessage> order(const Daemon& daemon, const char* member, const char* replySignature,
                           const Arguments&... arguments);
  using NamedState = std::pair<std::string, UnitState>;
  template <typename... Arguments>
  Result<std::vector<NamedState>> listed(const char* member, const std::vector<std::string>& units,
                                         const Arguments&... arguments);
  /// Of each unit, in the same order.
  Result<std::vector<UnitState>> states(const std::vector<Daemon>& daemons);
  Result<BusMessage> unitProperty(const Daemon& daemon, const char* name, const char* signature);
  /// A word such as "enabled", as systemctl(1) lists them; empty when there is no such unit file.
  Result<std::string> fileState(const Daemon& daemon);
  /// The manager does not take them up before it is reloaded.
  Result<void> changeLinks(const Daemon& daemon, bool start, WrittenPlaces& written);
  /// Runs a job to its end.
  Result<void> runJob(const Daemon& daemon, const char* method);
  Failure whyNotRunning(const Daemon& daemon);
  /// As it is written in a unit file; absent when all conditions hold, or that cannot be told.
  std::optional<std::string> unmetCondition(const Daemon& daemon);

  ServiceAccess& _services;
  const SystemRoot& _root;
  RunLoop& _runLoop;
};

}  // namespace tavisk
