// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/apply/Applier.h"

#include <algorithm>
#include <span>
#include <utility>

#include "control/Ending.h"
#include "effects/SettingNames.h"

namespace tavisk::control {
namespace {

using Results = std::vector<WordResult>;

std::optional<std::string> valueOf(const SettingState& state) {
  return state.value.live ? state.value.live : state.value.stored;
}

bool isAsAsked(const AskedValue& asked, const SettingState& state) {
  const auto& [live, stored] = std::pair(state.value.live, state.value.stored);
  const auto isIt = [&](const auto& found) { return !found || isSameValue(*asked.setting, *found, *asked.value); };
  return asked.value && (live || stored) && isIt(live) && isIt(stored) && state.failures.empty();
}

bool areAllAsAsked(const Step& step, std::span<const SettingState> states) {
  for (std::size_t i = 0; i < step.asked.size(); ++i)
    if (!isAsAsked(step.asked[i], states[i])) return false;
  return true;
}

/// What else a word of a setting changes is a part of that.
bool isOf(const Effect& effect, const ManagedSetting& setting) {
  return effect.setting == setting.name || !managedNamed(effect.setting);
}

/// The results with nothing but the effects of one setting.
Results resultsFor(const ManagedSetting& setting, Results results) {
  for (auto& result : results)
    std::erase_if(result.effects, [&](const Effect& effect) { return !isOf(effect, setting); });
  return results;
}

AppliedSetting seen(const AskedValue& asked, const SettingState& before, const SettingState& after) {
  AppliedSetting applied{.setting = asked.setting, .unit = after.value.unit, .wanted = asked.value};
  applied.before = valueOf(before);
  if (before.value.stored != applied.before) applied.storedBefore = before.value.stored;
  applied.after = valueOf(after);
  applied.stored = after.value.stored;
  applied.undoneBy = after.value.undoneBy;
  return applied;
}

/// What is in force may be less than what was asked for and is stored: a name without its domain. In place of an empty
/// name a getter tells another one.
bool isLasting(const AppliedSetting& applied) {
  const bool isGranted = applied.verdict <= Verdict::applied && applied.setting->kind != ValueKind::startupDisk;
  const auto& target = isGranted && applied.wanted ? applied.wanted : applied.after;
  const bool isStored =
      !applied.stored || !target || target->empty() || isSameValue(*applied.setting, *applied.stored, *target);
  return isStored && applied.undoneBy.empty();
}

void fail(AppliedSetting& applied, std::string reason) {
  applied.verdict = Verdict::failed;
  applied.reason = std::move(reason);
}

/// The setting itself stands without what only goes along with it.
bool isUnsupportedCompanion(const Effect& effect, const ManagedSetting& setting) {
  return effect.setting != setting.name && effect.outcome == Outcome::notSupported;
}

void addTold(AppliedSetting& applied, Results results) {
  for (auto& result : results) {
    for (const auto& effect : result.effects)
      if (isUnsupportedCompanion(effect, *applied.setting))
        applied.notes.push_back(effect.setting + " is not supported: " + describe(effect.failure.value_or(Failure())));
    std::erase_if(result.effects, [&](const auto& effect) { return isUnsupportedCompanion(effect, *applied.setting); });
    const auto verdict = verdictOf(result);
    if (verdict > applied.verdict) applied.reason = reasonOf(result);
    applied.verdict = std::max(applied.verdict, verdict);
    for (const auto& effect : result.effects) {
      applied.isChanged = applied.isChanged || effect.changed;
      if (!effect.note.empty()) applied.notes.push_back(effect.note);
    }
  }
}

/// What the host has taken for the value asked for, which may be less: a name without its domain.
std::optional<std::string> expectedOf(const AppliedSetting& applied, const Results& results) {
  auto expected = applied.wanted;
  for (const auto& result : results)
    for (const auto& effect : result.effects)
      if (effect.setting == applied.setting->name && effect.live) expected = effect.live;
  return expected;
}

/// Granted is what is seen afterwards. Of a startup disk effects tell another text.
void checkBySight(AppliedSetting& applied, const SettingState& after, const Results& results) {
  const auto expected = expectedOf(applied, results);
  const bool isText = expected && !expected->empty() && applied.after;
  const bool isComparable = isText && applied.setting->kind != ValueKind::startupDisk;
  const bool isTold = std::ranges::any_of(results, [](const auto& result) { return !result.effects.empty(); });
  if (!after.failures.empty()) {
    fail(applied, describe(after.failures.front()));
  } else if (after.value.unsupported) {
    applied.verdict = Verdict::notSupported;
    applied.reason = describe(*after.value.unsupported);
  } else if (isComparable && !isSameValue(*applied.setting, *applied.after, *expected)) {
    fail(applied, describe({"read back", std::string(applied.setting->name), "reads " + *applied.after}));
  } else if (!isTold && applied.before != applied.after) {
    applied.verdict = Verdict::applied;
  }
}

/// Where a reset has taken something away.
void addPlacesLeft(AppliedSetting& applied, const WordResult& result) {
  for (const auto& effect : result.effects)
    if (effect.setting == applied.setting->name && effect.changed && !effect.where.empty())
      applied.notes.insert(applied.notes.begin(), "no longer kept in " + effect.where);
}

AppliedSetting judged(const AskedValue& asked, const SettingState& before, const SettingState& after,
                      const Results& results) {
  auto applied = seen(asked, before, after);
  addTold(applied, results);
  if (applied.verdict <= Verdict::applied) checkBySight(applied, after, results);
  applied.isChanged = applied.isChanged || applied.verdict == Verdict::applied;
  applied.lasts = isLasting(applied);
  return applied;
}

bool isOff(const SettingState& state) {
  return state.value.unsupported || (state.value.live == "off" && state.value.stored.value_or("off") == "off");
}

bool isOnUntilRestart(const ManagedSetting& setting, const SettingState& state) {
  return setting.name == setting::networkTime && state.value.live == "on" && state.value.stored == "off";
}

/// Status and effects tell the disk, and what it starts behind that; the words know its volume.
std::string nameOfSystem(const std::string& value, DiskEventSession& disks) {
  const auto disk = disks.description({value.substr(0, value.find(' '))});
  if (!disk) return value;
  const bool isOther = disk->volumePath && disk->volumePath != "/";
  return (isOther ? disk->volumePath : disk->volumeName).value_or(value);
}

}  // namespace

std::vector<AppliedSetting> Applier::apply(const Step& step) {
  const auto before = statesOf(step);
  const bool isNeeded = !areAllAsAsked(step, before);
  Results results;
  if (isNeeded)
    for (const auto& words : wordsOf(step, before.front())) results.push_back(_runner.run(words));
  const auto after = isNeeded ? statesOf(step) : before;
  std::vector<AppliedSetting> applied;
  for (std::size_t i = 0; i < step.asked.size(); ++i)
    applied.push_back(judged(step.asked[i], before[i], after[i], resultsFor(*step.asked[i].setting, results)));
  return applied;
}

AppliedSetting Applier::reset(const ManagedSetting& setting) {
  const auto before = stateOf(setting);
  const auto result = _runner.run([&](Host& host) { host.resets().reset(std::string(setting.name)); });
  const auto after = stateOf(setting);
  auto applied = seen({&setting, std::nullopt}, before, after);
  applied.undoneBy.clear();
  addTold(applied, {result});
  addPlacesLeft(applied, result);
  if (applied.verdict <= Verdict::applied && !after.failures.empty()) fail(applied, describe(after.failures.front()));
  applied.lasts = applied.verdict <= Verdict::applied || isLasting(applied);
  return applied;
}

/// What a searched setting's getter asks in the end is asked without a search: it keeps the answer for the whole run.
SettingState Applier::stateOf(const ManagedSetting& setting) {
  auto states = _reader.read({&setting}, [this](const ManagedSetting& asked) {
    if (asked.isSearched)
      static_cast<void>(_host.diskManagement().bootPreference());
    else
      static_cast<void>(_runner.run(std::vector{std::string(asked.getter)}));
  });
  auto& state = states.front();
  state.value = asSet(std::move(state.value));
  return std::move(state);
}

std::vector<SettingState> Applier::statesOf(const Step& step) {
  std::vector<SettingState> states;
  for (const auto& asked : step.asked) states.push_back(stateOf(*asked.setting));
  return states;
}

std::vector<std::vector<std::string>> Applier::wordsOf(const Step& step, const SettingState& state) {
  if (!step.words.empty()) return {step.words};
  const auto& [setting, value] = step.asked.front();
  if (setting->kind == ValueKind::startupDisk) return setterWords(*setting, nameOfSystem(*value, _host.diskEvents()));
  auto words = setterWords(*setting, *value);
  // Where it is on, the word does not look at what is stored.
  if (*value == "on" && isOnUntilRestart(*setting, state))
    words.insert(words.begin(), setterWords(*setting, "off").front());
  return words;
}

bool isLockoutRefused(std::span<const Step> steps, Applier& applier, const Invocation& invocation, const Tools& tools) {
  if (invocation.has("--allow-lockout") || std::ranges::none_of(steps, mayLockOut)) return false;
  if (isOff(applier.stateOf(*managedNamed(setting::remoteLogin)))) return false;
  tools.complain("Remote Login is not turned off without --allow-lockout; nothing was changed");
  return true;
}

bool isDone(Verdict verdict, bool lasts, const Invocation& invocation) {
  if (verdict == Verdict::notSupported) return invocation.has("--skip-unsupported");
  return verdict <= Verdict::applied && lasts;
}

Status withApplier(const Tools& tools, const std::function<Status(Applier& applier)>& change) {
  const EndingSignals signals;
  EffectSink effects;
  StatusReader reader;
  effects.addChannel(reader);
  RunLoop runLoop;
  const auto host = tools.openHost(effects, runLoop);
  if (!host) return endBy(host.failure(), Status::incomplete, tools);
  WordRunner runner(**host, effects, runLoop);
  const auto waiter = endBySignal(
      signals, [&](const std::string& signal) { runner.endedBySignal(signal); }, tools);
  if (const auto started = runner.start(); !started) return endBy(started.failure(), Status::incomplete, tools);
  Applier applier(**host, runner, reader);
  return change(applier);
}

}  // namespace tavisk::control
