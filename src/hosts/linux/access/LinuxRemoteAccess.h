// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <vector>

#include "hosts/linux/services/Daemons.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "platform/RemoteAccess.h"

namespace tavisk {

/// The SSH server's service and socket, under whichever of their names, or the units that the administrator names for
/// "remote-shell". One of them is enough to be on; none of them is left when it is off. Open sessions stay.
class LinuxRemoteShellService final : public RemoteShellService {
 public:
  explicit LinuxRemoteShellService(const LinuxMachine& machine) : _machine(machine) {}

  bool isEnabled() override;
  void setEnabled(bool enabled) override;

 private:
  Result<DaemonGroup> knownServer();
  /// What this machine has of it.
  Result<DaemonGroup> server();
  template <typename Answer, typename Use>
  Result<Answer> withServer(Use use);
  Support supported();
  Result<bool> hasAny(Result<std::vector<Daemon>> (DaemonGroup::*those)() const);
  Result<bool> isOnInAnyWay();
  Result<void> store(bool enabled);
  Result<void> apply(bool enabled);
  /// Where no host key is, a connection would be taken and dropped.
  Result<void> ensureHostKeys();

  LinuxMachine _machine;
};

/// The units that the administrator names for "remote-events"; without any there is nothing to switch. The first one
/// decides whether it is on, all of them are switched.
class LinuxRemoteEventsService final : public RemoteEventsService {
 public:
  explicit LinuxRemoteEventsService(const LinuxMachine& machine) : _machine(machine) {}

  bool isEnabled() override;
  void setEnabled(bool enabled) override;

 private:
  Result<DaemonGroup> units();
  Support supported();
  /// "partly on" when some run.
  Setting<bool>::Found live();
  Result<bool> startsAtBoot();
  Result<bool> isOnInAnyWay();

  LinuxMachine _machine;
};

}  // namespace tavisk
