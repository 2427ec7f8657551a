// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {

/// Where failures go of questions whose answers have no room for one: what could not be looked at is told to the
/// effects as a failure of the startup disk, once a command for each reason, however much cannot be looked at for it.
/// From any thread.
class FailedLooks {
 public:
  explicit FailedLooks(EffectSink& effects) : _effects(effects) {}

  void tell(const Failure& failure);
  /// The value, or an empty one after the failure was told.
  template <typename Value>
  Value orTold(Result<Value> looked) {
    if (looked) return std::move(looked).value();
    tell(looked.failure());
    return Value();
  }

  /// The same for what a value of the firmware is made of: whoever writes one has to ask whether it is to be trusted.
  void tellDoubt(const Failure& failure);
  /// The first such failure since the last call, unless it was told so long ago that another command had it.
  std::optional<Failure> takeDoubt();

 private:
  EffectSink& _effects;
  std::mutex _mutex;
  std::map<std::string, RunLoop::Clock::time_point> _told;  ///< by reason
  struct Doubt {
    Failure failure;
    RunLoop::Clock::time_point at;
  };
  std::optional<Doubt> _doubt;
};

}  // namespace tavisk
