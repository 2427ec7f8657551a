// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
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
  /// Whether this run's user may change something; asks the user if need be. Empty: yes.
  std::function<Result<void>()> authorizeChange = {};
};

/// The lock under which a change is made. The user is asked before it is taken: an answer takes its time, and nobody
/// else is to wait for it.
inline Result<FileDescriptor> beginChange(const LinuxMachine& machine) {
  const auto authorized = machine.authorizeChange ? machine.authorizeChange() : Result<void>();
  if (!authorized) return authorized.failure();
  return MachineLock(machine.root, machine.runLoop).hold();
}

/// carryOut() by a user who may, while no other run changes this machine. Else it is failed, and nothing is looked at.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, const LinuxMachine& machine) {
  const auto lock = beginChange(machine);
  if (lock) return carryOut(setting, asked, machine.effects, machine.runLoop);
  Effect effect{.setting = setting.name, .outcome = Outcome::failed, .asked = textOf(asked), .failure = lock.failure()};
  machine.effects.record(effect);
  return effect;
}

}  // namespace tavisk
