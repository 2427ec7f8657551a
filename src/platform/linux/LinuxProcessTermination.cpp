// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxProcessTermination.h"

namespace tavisk {

void LinuxProcessTermination::disable() {
  if (_holds++ > 0) return;
  auto bus = _machine.services.systemBus();
  if (!bus) return;
  const BusObject logins{"org.freedesktop.login1", "/org/freedesktop/login1", "org.freedesktop.login1.Manager"};
  auto hold = (*bus)->query(logins, "Inhibit", "h", "shutdown", "tavisk", "The startup disk is being set", "delay");
  if (hold) _hold = std::move(hold).value().readDescriptor();
}

void LinuxProcessTermination::enable() {
  if (_holds > 0 && --_holds == 0) _hold = FileDescriptor();
}

}  // namespace tavisk
