// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <concepts>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// A value of a setting as a machine has it. Where the machine's parts differ it is that of the part which has most of
/// it, and `detail` says for people which part has what: "10 on sda, 0 on sdb", "on after a kernel panic only".
template <typename Value>
struct Reading {
  Reading(Value itsValue) : value(std::move(itsValue)) {}
  Reading(Value itsValue, std::string itsDetail) : value(std::move(itsValue)), detail(std::move(itsDetail)) {}

  Value value;
  std::string detail;  ///< empty: the value is all there is to say
};

/// The texts by which effects, reports and logs tell a value; another type of value has its own overload beside it.
inline std::string textOf(const std::string& value) {
  return value;
}
inline std::string textOf(std::int64_t value) {
  return std::to_string(value);
}
template <std::same_as<bool> Switch>
std::string textOf(Switch isOn) {
  return isOn ? "on" : "off";
}

/// Why a machine cannot have a setting, as against a look that fails.
struct NotSupported {
  Failure reason;
};

/// Whether a machine can have a setting: absent, it can. A failure says that this could not be found out.
using Support = Result<std::optional<NotSupported>>;

/// Whether what is asked of a machine is done, or only foretold: found out as far as that goes without touching it.
enum class Conduct { change, forecast };

/// What the tool itself stores of a setting, apart from what others do. Without `isThere` it has no place of its own.
struct OwnPart {
  std::function<Result<bool>()> isThere;
  /// Why it would not be taken away: found out without touching anything.
  std::function<Result<void>()> check;
  /// The places from which it was taken are added, whatever comes of the rest.
  std::function<Result<void>(WrittenPlaces& taken)> takeAway;
};

/// A remark that is the same whatever is asked.
inline auto saying(std::string text) {
  return [text = std::move(text)](const auto&) { return text; };
}

/// One setting of a host, as the five small parts from which every change is made (supported, live, stored, store,
/// apply). A part that is left empty does not apply: a setting that is stored only has no `live` and no `apply`.
template <typename SettingValueType>
struct Setting {
  using Value = SettingValueType;
  using Found = Result<std::optional<Reading<Value>>>;  ///< absent: the setting has no value
  using Read = std::function<Found()>;
  using Write = std::function<Result<void>(const Value& value)>;
  /// Asked for once when a change has ended.
  using Remark = std::function<std::string(const Value& asked)>;

  std::string name;   ///< one of effects/SettingNames.h
  std::string unit;   ///< see SettingValue
  std::string where;  ///< the places in which it is stored, so that it survives a restart
  /// Those of them that the last change has written; empty: all if storing succeeded, else none.
  std::function<std::string()> written;
  Remark undoneBy;               ///< see Effect
  Remark note;                   ///< see Effect; of a change that has not failed
  std::function<Facts()> facts;  ///< see SettingValue
  std::function<Support()> supported;
  Read live;
  Read stored;
  /// Why the value is not taken: found out without touching anything, before `store` and by a forecast.
  Write check;
  Write store;
  Write apply;
  /// Why the value would be stored and then not applied, as far as that shows beforehand; for a forecast alone.
  Write foresee;
  /// The live value that comes of a value asked for, where the machine cannot do quite that; empty: the same.
  std::function<Value(const Value& asked)> liveFor;
  /// Whether the live value has reached what was asked; asked again after each event, for at most 3 s.
  std::function<bool(const Value& value)> settled;
  OwnPart own;
  /// Puts into force what is stored, where that is more than apply() of its value; empty: it is not.
  std::function<Result<void>()> applyStored;
  /// What is in force after a restart where nothing is stored; absent: it is not known.
  std::optional<Value> withoutStored;
  /// Puts back what store() has replaced, when the value has not become what was asked; empty: what is stored stays.
  std::function<Result<void>()> takeBack;
  /// Write although live and stored already have the value (a machine that counts its operations).
  bool always = false;
  /// Of what is not read: whatever is done, the machine is as before (a daemon that reads its files again).
  bool leavesNoTrace = false;
};

/// The one order of a change: supported, read, return when live and stored both have the value, check, store, apply,
/// wait until settled, read both back. Whatever happens is told to the sink, and returned.
template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, EffectSink& effects,
                RunLoop& runLoop);

/// What carryOut() would come to, with nothing touched: supported, read, check, foresee. Its effect tells what would be
/// read back. One that is unchanged has a failure too where another value would have to be replaced and could not be.
template <typename Value>
Effect foretell(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, EffectSink& effects);

/// Reads the live value (the stored one where there is no live one) and tells it to the sink, beside the stored one
/// and the places where somebody wants to know, or that the machine cannot have it. A read that fails is recorded as a
/// failed effect and yields no value.
template <typename Value>
std::optional<Value> observe(const Setting<Value>& setting, EffectSink& effects);

/// What is behind the two, with the values as texts.
namespace change {

inline constexpr std::chrono::seconds longestSettling{3};

/// What a read came to: its text, absent without a value, and whether it is what was asked for.
struct Sight {
  std::optional<std::string> text;
  bool isAsked = false;
};

struct Steps {
  std::string name;
  std::string where;
  std::string asked;
  std::string askedLive;  ///< the live value that is to come of it
  std::function<std::string()> written;
  std::function<std::string()> undoneBy;
  std::function<std::string()> note;
  std::function<Support()> supported;
  std::function<Result<Sight>()> live;
  std::function<Result<Sight>()> stored;
  std::function<Result<void>()> check;
  std::function<Result<void>()> store;
  std::function<Result<void>()> apply;
  std::function<Result<void>()> foresee;
  std::function<bool()> settled;
  std::function<Result<void>()> takeBack;
  bool always = false;
  bool leavesNoTrace = false;
};

Effect carryOut(const Steps& steps, EffectSink& effects, RunLoop& runLoop);
Effect foretell(const Steps& steps, EffectSink& effects);

template <typename Value>
std::string textOfReading(const Reading<Value>& reading) {
  return reading.detail.empty() ? textOf(reading.value) : reading.detail;
}

/// No text is the empty one.
template <typename Value>
bool isJust(const std::optional<Reading<Value>>& found, const Value& wanted) {
  if constexpr (std::same_as<Value, std::string>) {
    if (!found) return wanted.empty();
  }
  return found && found->detail.empty() && found->value == wanted;
}

template <typename Value>
std::function<Result<Sight>()> looking(const typename Setting<Value>::Read& read, const Value& wanted) {
  if (!read) return nullptr;
  return [&read, wanted]() -> Result<Sight> {
    const auto found = read();
    if (!found) return found.failure();
    return Sight{*found ? std::optional(textOfReading(**found)) : std::nullopt, isJust(*found, wanted)};
  };
}

/// A step with the value that it is about; empty when the setting has no such step.
template <typename Step, typename Value>
auto about(const Step& step, const Value& value) {
  using Bound = std::function<decltype(step(value))()>;
  return step ? Bound([&step, &value] { return step(value); }) : Bound();
}

/// All of what is given must outlive the steps.
template <typename Value>
Steps stepsOf(const Setting<Value>& setting, const Value& asked) {
  const auto live = setting.liveFor ? setting.liveFor(asked) : asked;
  return {
      .name = setting.name,
      .where = setting.where,
      .asked = textOf(asked),
      .askedLive = textOf(live),
      .written = setting.written,
      .undoneBy = about(setting.undoneBy, asked),
      .note = about(setting.note, asked),
      .supported = setting.supported,
      .live = looking(setting.live, live),
      .stored = looking(setting.stored, asked),
      .check = about(setting.check, asked),
      .store = about(setting.store, asked),
      .apply = about(setting.apply, asked),
      .foresee = about(setting.foresee, asked),
      .settled = about(setting.settled, asked),
      .takeBack = setting.takeBack,
      .always = setting.always,
      .leavesNoTrace = setting.leavesNoTrace,
  };
}  // NOLINT(clang-analyzer-cplusplus.NewDeleteLeaks): what is in a std::function is its own

}  // namespace change

template <typename Value>
Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, EffectSink& effects,
                RunLoop& runLoop) {
  return change::carryOut(change::stepsOf(setting, asked), effects, runLoop);
}

template <typename Value>
Effect foretell(const Setting<Value>& setting, const std::type_identity_t<Value>& asked, EffectSink& effects) {
  return change::foretell(change::stepsOf(setting, asked), effects);
}

namespace change {

/// The text of a value that was read; absent without one, and where the look failed, which is recorded.
template <typename Value>
std::optional<std::string> textOfFound(const typename Setting<Value>::Found& found, const Setting<Value>& setting,
                                       EffectSink& effects) {
  if (found) return *found ? std::optional(textOfReading(**found)) : std::nullopt;
  effects.recordFailure(setting.name, found.failure());
  return std::nullopt;
}

/// What has no stored value is not kept anywhere.
template <typename Value>
void addPlaces(SettingValue& value, const Setting<Value>& setting, const typename Setting<Value>::Found& found,
               const typename Setting<Value>::Found& stored) {
  if (value.stored) value.where = setting.where;
  const auto& lasting = stored && *stored ? stored : found;
  if (setting.facts) value.facts = setting.facts();
  if (setting.undoneBy && lasting && *lasting) value.undoneBy = setting.undoneBy((*lasting)->value);
}

}  // namespace change

template <typename Value>
std::optional<Value> observe(const Setting<Value>& setting, EffectSink& effects) {
  const auto found = setting.live ? setting.live() : setting.stored();
  const bool asksMore = !found || effects.wantsValues();
  const auto support = asksMore && setting.supported ? setting.supported() : Support(std::nullopt);
  SettingValue value{.setting = setting.name, .unit = setting.unit};
  if (support && *support) {
    value.unsupported = (*support)->reason;
  } else {
    (setting.live ? value.live : value.stored) = change::textOfFound<Value>(found, setting, effects);
    const bool hasBoth = setting.live && setting.stored && effects.wantsValues();
    const auto stored = hasBoth ? setting.stored() : typename Setting<Value>::Found(std::nullopt);
    // What keeps both from being looked at is told once.
    if (hasBoth && (found || stored)) value.stored = change::textOfFound<Value>(stored, setting, effects);
    if (!found && !value.stored) return std::nullopt;
    if (effects.wantsPlaces()) change::addPlaces<Value>(value, setting, found, stored);
  }
  effects.observe(value);
  return found && *found ? std::optional((*found)->value) : std::nullopt;
}

}  // namespace tavisk
