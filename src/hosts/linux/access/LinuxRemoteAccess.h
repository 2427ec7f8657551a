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
/// "remote-shell". One of them is enough to be on, as a socket that listens; none of them is left when it is off. Open
/// sessions stay.
class LinuxRemoteShellService final : public RemoteShellService {
 public:
  explicit LinuxRemoteShellService(const LinuxMachine& machine) : _machine(machine) {}

  RemoteAccessState state() override;
  void setEnabled(bool enabled) override;

 private:
  /// What the last change has come to.
  struct Trace {
    WrittenPlaces written;
    bool hasStopped = false;
  };
  Setting<bool> remoteLogin();
  Result<DaemonGroup> knownServer();
  /// What this machine has of it.
  Result<DaemonGroup> server();
  template <typename Answer, typename Use>
  Result<Answer> withServer(Use use);
  Support supported();
  Result<void> check(bool enabled);
  Result<void> foreseeStart();
  Result<void> store(bool enabled, Trace& trace);
  Result<void> startAtBoot(const DaemonGroup& server, WrittenPlaces& written);
  Result<void> apply(bool enabled, Trace& trace);
  /// Where no host key is, a connection would be taken and dropped.
  Result<void> ensureHostKeys(Trace& trace);

  LinuxMachine _machine;
};

/// The units that the administrator names for "remote-events"; without any there is nothing to switch. All of them are
/// switched. A service whose socket is among them may wait for that one to start it. After a restart it is on when the
/// first one starts with the machine, and each other that can be enabled: what the first brings with it cannot.
class LinuxRemoteEventsService final : public RemoteEventsService {
 public:
  explicit LinuxRemoteEventsService(const LinuxMachine& machine) : _machine(machine) {}

  RemoteAccessState state() override;
  void setEnabled(bool enabled) override;

 private:
  Setting<bool> remoteEvents();
  Result<DaemonGroup> units();
  template <typename Answer, typename Use>
  Result<Answer> withUnits(Use use);
  Support supported();
  /// "partly on" when some run.
  Setting<bool>::Found live();
  /// "partly on" when the first one will not, or another that could be enabled.
  Setting<bool>::Found stored();

  LinuxMachine _machine;
};

}  // namespace tavisk
