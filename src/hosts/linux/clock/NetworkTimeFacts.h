// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "effects/Effect.h"
#include "hosts/linux/clock/TimeDaemons.h"
#include "hosts/linux/services/LinuxMachine.h"

namespace tavisk {

/// What an administrator asks next of network time: whether the clock is kept right, by the kernel's account, and by
/// that of the client where it has the time from. `running` is null while no client runs.
Facts networkTimeFacts(const TimeDaemon* running, const LinuxMachine& machine);

}  // namespace tavisk
