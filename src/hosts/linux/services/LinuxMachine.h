// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <type_traits>
#include <utility>

#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/linux/services/ServiceAccess.h"
#include "hosts/linux/system/MachineLock.h"
#include "hosts/linux/system/ResetMark.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SettingReset.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What every service of the Linux host works with. All of it outlives the services.
struct LinuxMachine {
  const SystemRoot& root;
  EffectSink& effects;
  RunLoop& runLoop;
  ServiceAccess& services;
  /// Whether this run's user may change something; asks the user if need be. Empty: yes.
  std::function<Result<void>()> authorizeChange = {};
  Conduct conduct = Conduct::change;
};

/// While it lives this run may change the machine, and no other run does; or why that could not be had.
using MachineHold = Result<FileDescriptor>;

/// The user is asked before the lock is taken: an answer takes its time, and nobody else is to wait for it. A forecast
/// needs neither.
inline MachineHold hold(const LinuxMachine& machine) {
  if (machine.conduct == Conduct::forecast) return FileDescriptor();
  const auto authorized = machine.authorizeChange ? machine.authorizeChange() : Result<void>();
  if (!authorized) return authorized.failure();
  return MachineLock(machine.root, machine.runLoop).hold();
}

/// carryOut() as a part of what is done while the machine is held. Without that it is failed, and nothing is looked at.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine,
                const MachineHold& held) {
  if (machine.conduct == Conduct::forecast) return foretell(setting, asked, machine.effects);
  if (held) return carryOut(setting, asked, machine.effects, machine.runLoop);
  Effect effect{.setting = setting.name, .outcome = Outcome::failed, .asked = textOf(asked), .failure = held.failure()};
  machine.effects.record(effect);
  return effect;
}

/// carryOut() by a user who may, while no other run changes this machine.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine) {
  return carryOut(setting, asked, machine, hold(machine));
}

/// reset() as a part of what is done while the machine is held.
template <typename Value>
Effect reset(const Setting<Value>& setting, const LinuxMachine& machine, const MachineHold& held) {
  if (held) return reset(setting, machine.effects, machine.runLoop, machine.conduct);
  Effect effect{.setting = setting.name, .outcome = Outcome::failed, .asked = resetAsked, .failure = held.failure()};
  machine.effects.record(effect);
  return effect;
}
/// When all of a reset is done, and not only foretold.
inline void unmark(const ResetMark& mark, const Effect& effect, const LinuxMachine& machine) {
  if (machine.conduct == Conduct::change && effect.outcome == Outcome::applied) mark.remove();
}

/// reset() by a user who may, while no other run changes this machine; one that was cut short is ended.
template <typename Value>
Effect reset(Setting<Value> setting, const LinuxMachine& machine) {
  const ResetMark mark(machine.root, setting.name);
  setting.own = mark.around(std::move(setting.own));
  const auto held = hold(machine);
  auto effect = reset(setting, machine, held);
  unmark(mark, effect, machine);
  return effect;
}

}  // namespace tavisk
