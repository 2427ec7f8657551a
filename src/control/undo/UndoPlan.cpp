// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/undo/UndoPlan.h"

#include <algorithm>
#include <iterator>
#include <string_view>
#include <utility>

#include "base/DnsName.h"
#include "control/SettingValues.h"
#include "effects/SettingNames.h"
#include "platform/ResetService.h"

namespace tavisk::control {
namespace {

/// What is done for the sake of a setting, and has no value of its own.
constexpr std::string_view acts[] = {setting::networkTimeRestart, setting::preferencesWrite, setting::signalToProcess};

/// What a word changes beside its own setting.
struct Companion {
  std::string_view name;
  std::string_view main;
};
constexpr Companion companions[] = {
    {setting::networkTimeAtStartup, setting::networkTime},
    {setting::keyboardLock, setting::keyboardLockPreference},
};

bool isAct(const RecordedChange& change) {
  return std::ranges::find(acts, change.setting) != std::end(acts);
}

const Companion* companionNamed(std::string_view name) {
  const auto* const found = std::ranges::find(companions, name, &Companion::name);
  return found == std::end(companions) ? nullptr : &*found;
}

const SettingState* stateOf(std::span<const SettingState> states, std::string_view setting) {
  const auto found = std::ranges::find(states, setting, [](const auto& state) { return state.value.setting; });
  return found == states.end() ? nullptr : &*found;
}

/// All changes of each setting as one, in the order in which they began.
std::vector<RecordedChange> merged(std::span<const RecordedChange> changes) {
  std::vector<RecordedChange> merged;
  for (const auto& change : changes) {
    const auto known = std::ranges::find(merged, change.setting, &RecordedChange::setting);
    if (known == merged.end()) {
      merged.push_back(change);
    } else {
      known->after = change.after;
      known->isAfterKnown = change.isAfterKnown;
    }
  }
  return merged;
}

void addOnce(std::vector<const ManagedSetting*>& settings, const ManagedSetting* setting) {
  if (std::ranges::find(settings, setting) == settings.end()) settings.push_back(setting);
}

PlannedUndo& impossible(PlannedUndo& planned, std::string why) {
  planned.step = UndoStep::impossible;
  planned.why = std::move(why);
  return planned;
}

/// Why the words of tavisk do not give the value; empty when they do.
std::string whyNoWordGives(const ManagedSetting& setting, const std::string& value, const std::string& unit) {
  if (setting.kind == ValueKind::moment)
    return "a clock goes on, and the time from before is over: set it, or turn network time on";
  const bool takesEmpty = setting.name == setting::computerName;
  if (value.empty() && !takesEmpty) return "it was empty, which tavisk cannot set";
  const auto meant = valueMeantBy(setting, value, unit);
  const bool isName = setting.name != setting::localSubnetName || isDnsName(value);
  return meant && *meant == value && isName ? "" : "no word of tavisk gives it that value";
}

/// The same of the value from before.
std::string whyNotSet(const ManagedSetting& setting, const RecordedChange& change, const std::string& unit) {
  if (change.before) return whyNoWordGives(setting, *change.before, unit);
  if (change.isBeforeKnown) return "there was no value before";
  return change.isEnded ? "what it was before is not known"
                        : "a run that was ended in the middle did not tell what it was before";
}

bool hadNone(const RecordedChange& change) {
  return change.isBeforeKnown && change.before.value_or("").empty();
}

/// With what was read of it now.
PlannedUndo planned(const RecordedChange& change, const SettingState* state) {
  PlannedUndo planned{.setting = change.setting, .back = change.before};
  if (!state) return planned;
  planned.now = state->value.live ? state->value.live : state->value.stored;
  planned.unit = state->value.unit;
  return planned;
}

/// Also after a restart, as far as anybody knows.
bool isThere(const PlannedUndo& planned, const SettingState& state) {
  const auto& value = state.value;
  return state.failures.empty() && planned.now == planned.back &&
         (!value.live || !value.stored || value.live == value.stored);
}

/// A disk may be told with what it starts, and by what, behind it.
bool isSameTo(std::string_view setting, const std::optional<std::string>& now, const std::optional<std::string>& left) {
  if (!left) return now.value_or("").empty();
  if (setting != setting::startupDisk || !now) return now == left;
  return now->substr(0, now->find(' ')) == left->substr(0, left->find(' '));
}

/// Why nobody but tavisk is known to have changed it; empty when that is known.
std::string whyOthers(const PlannedUndo& planned, const RecordedChange& change, const SettingState& state) {
  if (!planned.now && !state.failures.empty())
    return "what it is now is not known: " + describe(state.failures.front());
  const bool isTold = change.isAfterKnown;
  if (!isTold || isSameTo(planned.setting, planned.now, change.after)) return "";
  const auto left = change.after ? "at \"" + *change.after + "\"" : "without a value";
  return "tavisk had left it " + left + ": somebody else has changed it since, see --force";
}

std::string whyLeft(const PlannedUndo& planned, const RecordedChange& change, const SettingState& state,
                    UndoConsent consent) {
  const bool isWayIn = planned.setting == setting::remoteLogin && planned.back == "off";
  if (isWayIn && !consent.toLockout) return "it is not turned off without --allow-lockout";
  return consent.toOthersChanges ? "" : whyOthers(planned, change, state);
}

/// A machine without a name for people is called by its host name.
bool isDefaultName(const PlannedUndo& planned, std::span<const SettingState> states) {
  const auto* hostName = planned.setting == setting::computerName ? stateOf(states, setting::localSubnetName) : nullptr;
  if (!planned.now || !hostName) return false;
  return planned.now == hostName->value.stored || planned.now == hostName->value.live;
}

PlannedUndo planManaged(const ManagedSetting& setting, const RecordedChange& change,
                        std::span<const SettingState> states, UndoConsent consent) {
  auto state = *stateOf(states, setting.name);
  state.value = asSet(std::move(state.value));
  auto plan = planned(change, &state);
  if (isDefaultName(plan, states)) plan.now = "";
  if (state.value.unsupported) return impossible(plan, "not supported: " + describe(*state.value.unsupported));
  const auto whyNot = whyNotSet(setting, change, plan.unit);
  const bool isReset = !whyNot.empty() && hadNone(change) && !whyNeverOwn(change.setting);
  if (!whyNot.empty() && !isReset) return impossible(plan, whyNot);
  if (isThere(plan, state)) {
    plan.step = UndoStep::there;
    return plan;
  }
  plan.why = whyLeft(plan, change, state, consent);
  const auto way = isReset ? UndoStep::reset : UndoStep::set;
  plan.step = plan.why.empty() ? way : UndoStep::leave;
  plan.managed = &setting;
  return plan;
}

/// The switch that a word gives both: keyboards are told as what they are.
std::optional<std::string> switchOf(const std::optional<std::string>& value) {
  if (value == "disabled") return "on";
  if (value == "enabled") return "off";
  return value;
}

/// Whether what becomes of the main setting gives the other its value too: what is reset goes off.
bool goesAlong(const PlannedUndo& main, const RecordedChange& companion) {
  if (main.step != UndoStep::set && main.step != UndoStep::reset) return false;
  return companion.before && switchOf(companion.before) == (main.step == UndoStep::reset ? "off" : main.back);
}

/// Absent when what is done anyway gives it its value.
std::optional<PlannedUndo> planCompanion(const Companion& companion, const RecordedChange& change,
                                         std::span<const PlannedUndo> plan, std::span<const SettingState> states) {
  const auto main = std::ranges::find(plan, companion.main, &PlannedUndo::setting);
  if (main != plan.end() && goesAlong(*main, change)) return std::nullopt;
  auto own = planned(change, stateOf(states, companion.name));
  const auto* mainState = stateOf(states, companion.main);
  if (!own.now && mainState) own.now = mainState->value.stored;
  if (own.now && own.now == own.back) {
    own.step = UndoStep::there;
    return own;
  }
  return impossible(own, "tavisk sets it together with " + std::string(companion.main) + " alone");
}

}  // namespace

const char* nameOf(UndoStep step) {
  switch (step) {
    case UndoStep::set:
      return "set";
    case UndoStep::reset:
      return "reset";
    case UndoStep::there:
      return "there already";
    case UndoStep::leave:
      return "left alone";
    case UndoStep::impossible:
      break;
  }
  return "not possible";
}

std::vector<RecordedChange> chosenChanges(std::span<const RecordedChange> changes, std::optional<std::int64_t> since) {
  std::vector<RecordedChange> chosen;
  std::ranges::remove_copy_if(changes, std::back_inserter(chosen), isAct);
  const auto last = chosen.empty() ? "" : chosen.back().run;
  std::erase_if(chosen, [&](const auto& change) { return since ? change.time < *since : change.run != last; });
  return chosen;
}

std::vector<const ManagedSetting*> settingsOf(std::span<const RecordedChange> changes) {
  std::vector<const ManagedSetting*> settings;
  for (const auto& change : changes) {
    const auto* companion = companionNamed(change.setting);
    const auto* setting = managedNamed(companion ? companion->main : change.setting);
    if (setting) addOnce(settings, setting);
  }
  if (std::ranges::find(settings, setting::computerName, &ManagedSetting::name) != settings.end())
    addOnce(settings, managedNamed(setting::localSubnetName));
  std::ranges::sort(settings);
  return settings;
}

std::vector<PlannedUndo> planUndo(std::span<const RecordedChange> changes, std::span<const SettingState> states,
                                  UndoConsent consent) {
  const auto merging = merged(changes);
  std::vector<PlannedUndo> plan;
  for (const auto* setting : settingsOf(changes)) {
    const auto change = std::ranges::find(merging, setting->name, &RecordedChange::setting);
    if (change != merging.end()) plan.push_back(planManaged(*setting, *change, states, consent));
  }
  for (const auto& change : merging) {
    const auto* companion = companionNamed(change.setting);
    if (managedNamed(change.setting)) continue;
    auto own =
        companion ? planCompanion(*companion, change, plan, states) : planned(change, stateOf(states, change.setting));
    if (own && !companion) impossible(*own, "no word of tavisk sets it by itself");
    if (own) plan.push_back(std::move(*own));
  }
  return plan;
}

}  // namespace tavisk::control
