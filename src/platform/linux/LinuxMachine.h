// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/EffectSink.h"
#include "platform/RunLoop.h"
#include "platform/SystemRoot.h"
#include "platform/linux/ServiceAccess.h"

namespace tavisk {

/// What every service of the Linux host works with. All of it outlives the services.
struct LinuxMachine {
  const SystemRoot& root;
  EffectSink& effects;
  RunLoop& runLoop;
  ServiceAccess& services;
};

/// What an administrator who is not root reads where only root may change something; absent for root.
std::optional<Failure> whyNeedsRoot(const std::string& tried, const std::string& on);

}  // namespace tavisk
