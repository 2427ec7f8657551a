// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>

#include "base/RunLoop.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/services/InitScriptDaemons.h"
#include "hosts/linux/services/UnitDaemons.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// How the services of this machine are reached: over the system bus, straight from the service manager where the bus
/// is down, or, where the machine has no service manager, by files and programs.
class ServiceAccess {
 public:
  using OpenLibrary = Result<SystemdLibrary> (*)();
  /// Root and loop must outlive the object. `openLibrary` is called at the first use of the bus.
  ServiceAccess(const SystemRoot& root, RunLoop& runLoop, OpenLibrary openLibrary = openSystemdLibrary)
      : _root(root), _runLoop(runLoop), _openLibrary(openLibrary) {}

  /// Whether the service manager runs the machine (sd_booted(3)). Yes too where that cannot be found out: whatever is
  /// then asked of the manager, its daemons and the bus fails with the reason, and no other way is taken.
  bool hasServiceManager();
  /// Fails too where the machine has no service manager, or no bus: isAbsent() tells that. Opened again after the bus
  /// went away.
  Result<Bus*> systemBus();
  Result<Bus*> serviceManager();
  /// A connection of the caller's own, for use by another thread than the main one. systemBus() was called before.
  Result<std::unique_ptr<Bus>> openSystemBus() const;

  /// Those of the service manager, or the init scripts of a machine that has none.
  Daemons& daemons();

 private:
  /// A look that failed is not repeated for a while: all that builds on it has the same answer.
  Result<bool> lookForManager();
  Result<const SystemdLibrary*> library();
  /// A connection that is kept; one that could not be had in time is not tried again for a while.
  struct Connection {
    const char* socket;
    Bus::Kind kind;
    std::unique_ptr<Bus> bus = nullptr;
    std::optional<Failure> failure = std::nullopt;
    RunLoop::Clock::time_point failedAt = {};
  };
  Result<Bus*> use(Connection& connection);
  Result<std::unique_ptr<Bus>> open(const Connection& connection);

  const SystemRoot& _root;
  RunLoop& _runLoop;
  OpenLibrary _openLibrary;
  std::optional<SystemdLibrary> _library;
  Connection _systemBus{"/run/dbus/system_bus_socket", Bus::Kind::messageBus};
  Connection _manager{"/run/systemd/private", Bus::Kind::straightToService};
  std::optional<Failure> _lookFailure;
  RunLoop::Clock::time_point _lookedAt;
  UnitDaemons _units{*this, _root, _runLoop};
  InitScriptDaemons _scripts{_root, _runLoop};
};

}  // namespace tavisk
