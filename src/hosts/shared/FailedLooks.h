// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <utility>

#include "base/Result.h"
#include "effects/EffectSink.h"

namespace tavisk {

/// Where failures go of questions whose answers have no room for one: they are told to the effects as failures of one
/// setting. In each command every reason is told once, however much cannot be looked at for it, and of the reasons the
/// first few: volumes hold what they like. From any thread.
class FailedLooks {
 public:
  static constexpr std::size_t mostTold = 16;

  /// The effects are not owned; the setting is one of effects/SettingNames.h.
  FailedLooks(EffectSink& effects, std::string setting) : _effects(effects), _setting(std::move(setting)) {}

  void tell(const Failure& failure);
  /// The value, or an empty one after the failure was told.
  template <typename Value>
  Value orTold(Result<Value> looked) {
    if (looked) return std::move(looked).value();
    tell(looked.failure());
    return Value();
  }

 private:
  /// How many reasons are told with this one; absent when it is not to be told.
  std::optional<std::size_t> count(const std::string& reason);

  EffectSink& _effects;
  std::string _setting;
  std::mutex _mutex;             ///< of what follows
  std::set<std::string> _told;   ///< the reasons
  unsigned _commandsBefore = 0;  ///< those that had ended when they were told
};

}  // namespace tavisk
