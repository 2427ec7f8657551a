// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/shared/PropertyListFile.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// What the effect of a reset says was asked for: the value shows only when the tool's own is gone.
inline constexpr const char* resetAsked = "what the machine has without tavisk";

/// Takes away what the tool itself stores of the setting (Setting::own), and puts into force what is stored then, else
/// `withoutStored`; where there is neither, what is in force stays. Without anything of the tool's own it is unchanged.
/// Also where the machine cannot have the setting any more. Whatever happens is told to the sink, and returned. A
/// forecast touches nothing, and does not know the value.
template <typename Value>
Effect reset(const Setting<Value>& setting, EffectSink& effects, RunLoop& runLoop, Conduct conduct = Conduct::change);

/// A key of a file of the tool's as what it stores of a setting. The file must outlive that.
OwnPart ownKey(const PropertyListFile& file, const std::string& key);

/// What is behind it, with the values as texts.
namespace change {

struct ResetSteps {
  using Look = std::function<Result<std::optional<std::string>>()>;

  std::string name;
  OwnPart own;
  std::function<Support()> supported;
  Look live;
  Look stored;
  /// Puts into force what is stored; false: nobody knows what that would be.
  std::function<Result<bool>()> follow;
  std::function<bool()> settled;
  /// Whether what is in force is what follow() was to put there.
  std::function<Result<bool>()> hasFollowed;
};

Effect reset(const ResetSteps& steps, EffectSink& effects, RunLoop& runLoop, Conduct conduct);

template <typename Value>
ResetSteps::Look lookingAt(const typename Setting<Value>::Read& read) {
  if (!read) return nullptr;
  return [&read]() -> Result<std::optional<std::string>> {
    const auto found = read();
    if (!found) return found.failure();
    return *found ? std::optional(textOfReading(**found)) : std::nullopt;
  };
}

template <typename Value>
using Target = std::optional<Reading<Value>>;

/// Absent: it is not known.
template <typename Value>
typename Setting<Value>::Found targetOf(const Setting<Value>& setting) {
  auto stored = setting.stored ? setting.stored() : typename Setting<Value>::Found(std::nullopt);
  if (!stored || *stored || !setting.withoutStored) return stored;
  return std::optional(Reading<Value>(*setting.withoutStored));
}

/// Where what is stored has parts that differ, so may what is in force.
template <typename Value>
Result<bool> hasFollowed(const Setting<Value>& setting, const Target<Value>& target) {
  if (!setting.live || !target) return true;
  const auto live = setting.live();
  if (!live) return live.failure();
  const auto wanted = setting.liveFor ? setting.liveFor(target->value) : target->value;
  return *live && (*live)->value == wanted && ((*live)->detail.empty() || !target->detail.empty());
}

/// A value that is in force already is not applied again.
template <typename Value>
Result<bool> follow(const Setting<Value>& setting, Target<Value>& target) {
  const bool hasToApply = setting.applyStored || setting.apply;
  if (!setting.live || !hasToApply) return true;
  const auto found = targetOf(setting);
  if (!found) return found.failure();
  target = *found;
  if (!target) return false;
  if (const auto isThere = hasFollowed(setting, target); !setting.applyStored && isThere && *isThere) return true;
  const auto applied = setting.applyStored ? setting.applyStored() : setting.apply(target->value);
  return applied ? Result<bool>(true) : applied.failure();
}

/// The setting must outlive the steps.
template <typename Value>
ResetSteps resetStepsOf(const Setting<Value>& setting) {
  const auto target = std::make_shared<Target<Value>>();
  ResetSteps steps;
  steps.name = setting.name;
  steps.own = setting.own;
  steps.supported = setting.supported;
  steps.live = lookingAt<Value>(setting.live);
  steps.stored = lookingAt<Value>(setting.stored);
  steps.follow = [&setting, target] { return follow(setting, *target); };
  steps.hasFollowed = [&setting, target] { return hasFollowed(setting, *target); };
  if (setting.settled) steps.settled = [&setting, target] { return !*target || setting.settled((*target)->value); };
  return steps;
}

}  // namespace change

template <typename Value>
Effect reset(const Setting<Value>& setting, EffectSink& effects, RunLoop& runLoop, Conduct conduct) {
  return change::reset(change::resetStepsOf(setting), effects, runLoop, conduct);
}

}  // namespace tavisk
