// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <type_traits>

#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/linux/services/ServiceAccess.h"
#include "hosts/linux/system/MachineLock.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What every service of the Linux host works with. All of it outlives the services.
struct LinuxMachine {
  const SystemRoot& root;
  EffectSink& effects;
  RunLoop& runLoop;
  ServiceAccess& services;
};

/// carryOut() while no other run changes this machine.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine) {
  const auto lock = MachineLock(machine.root, machine.runLoop).hold();
  if (lock) return carryOut(setting, asked, machine.effects, machine.runLoop);
  Effect effect{.setting = setting.name, .outcome = Outcome::failed, .asked = textOf(asked), .failure = lock.failure()};
  machine.effects.record(effect);
  return effect;
}

}  // namespace tavisk
