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

/// While it lives no other run changes this machine; or why that could not be had.
using MachineHold = Result<FileDescriptor>;

inline MachineHold hold(const LinuxMachine& machine) {
  return MachineLock(machine.root, machine.runLoop).hold();
}

/// carryOut() as a part of what is done while the machine is held.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine,
                const MachineHold& held) {
  if (held) return carryOut(setting, asked, machine.effects, machine.runLoop);
  Effect effect{.setting = setting.name, .outcome = Outcome::failed, .asked = textOf(asked), .failure = held.failure()};
  machine.effects.record(effect);
  return effect;
}

/// carryOut() while no other run changes this machine.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine) {
  return carryOut(setting, asked, machine, hold(machine));
}

}  // namespace tavisk
