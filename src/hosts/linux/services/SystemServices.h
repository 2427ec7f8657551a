// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/services/ServiceAccess.h"

namespace tavisk {

/// The services that several rooms call: the service manager (org.freedesktop.systemd1(5)), one of its units, whose
/// path it tells, and the keeper of logins (org.freedesktop.login1(5)).
BusObject serviceManager();
BusObject unitAt(const std::string& path);
BusObject loginManager();

/// The system bus, or null where nobody keeps one: the machine has no service manager, or nothing listens. Any other
/// reason is a failure, and no reason to do without the bus.
Result<Bus*> systemBusIfAny(ServiceAccess& services);

/// Has the service manager read its configuration and all unit files again.
Result<void> reloadServiceManager(ServiceAccess& services);

}  // namespace tavisk
