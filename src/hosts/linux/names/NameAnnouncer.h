// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/services/ServiceAccess.h"

namespace tavisk {

/// Who announces this machine on the local network: the multicast DNS responder (org.freedesktop.Avahi), else the
/// resolver (org.freedesktop.resolve1(5)), which follows the kernel's name by itself. Asking starts none of them.
class NameAnnouncer {
 public:
  /// Both must outlive the object.
  NameAnnouncer(ServiceAccess& services, RunLoop& runLoop) : _services(services), _runLoop(runLoop) {}

  /// The name that the responder announces, which is another one than it was told where the network has that already;
  /// absent when no responder runs.
  Result<std::optional<std::string>> respondersName();
  /// The name that whoever announces does; absent when nobody does.
  Result<std::optional<std::string>> name();

  /// Makes the responder announce a name of one label, until it or the machine restarts, and waits until the network
  /// has had its time to object. Nothing to do is a success.
  Result<void> announce(const std::string& label);
  /// Whether that time is over; true where no responder runs.
  Result<bool> hasRegistered();

 private:
  /// Null when the service does not run, or there is no bus at all.
  Result<Bus*> busOf(const char* service);
  Result<void> awaitRegistered(Bus& bus, const std::int32_t& state);

  ServiceAccess& _services;
  RunLoop& _runLoop;
};

}  // namespace tavisk
