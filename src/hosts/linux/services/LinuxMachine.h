// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/linux/services/ServiceAccess.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What every service of the Linux host works with. All of it outlives the services.
struct LinuxMachine {
  const SystemRoot& root;
  EffectSink& effects;
  RunLoop& runLoop;
  ServiceAccess& services;
};

}  // namespace tavisk
