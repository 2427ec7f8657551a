// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/Stage.h"

#include <algorithm>
#include <utility>

#include "hosts/scratch/MachineSettings.h"

namespace tavisk {
namespace {

bool isRefused(const Effect& effect) {
  return effect.outcome == Outcome::failed || effect.outcome == Outcome::notSupported;
}

/// Of a failed change: whether the value was stored all the same.
bool isStored(const Effect& effect) {
  return effect.stored && effect.stored == effect.asked;
}

/// What was foretold, but for what has come of it on the copy.
Effect failedAs(const Effect& copied, Effect effect) {
  effect.outcome = Outcome::failed;
  effect.failure = copied.failure;
  effect.live = copied.live;
  effect.stored = copied.stored;
  effect.changed = copied.changed;
  if (copied.where.empty()) effect.where.clear();
  return effect;
}

}  // namespace

Stage::Stage(const Players& players, EffectSink& audience)
    : _players(players), _audience(audience), _foretold(audience) {
  _players.machineEffects.addChannel(_foretold);
  _players.copyEffects.addChannel(*this);
}

Stage::~Stage() {
  _players.copyEffects.removeChannel(*this);
  _players.machineEffects.removeChannel(_foretold);
}

Stage::Effects Stage::play(const Act& act) {
  return play(act, [&](Host& copy, const Effects&) { act(copy); });
}

Stage::Effects Stage::play(const Act& onMachine, const std::function<void(Host&, const Effects&)>& onCopy) {
  auto effects = foretold(onMachine);
  refuse(effects);
  _copyFailures.clear();
  _isPlaying = true;
  onCopy(_players.copy, effects);
  _isPlaying = false;
  for (auto& effect : effects) {
    const auto failed = _copyFailures.find(effect.setting);
    if (!isRefused(effect) && failed != _copyFailures.end()) effect = failedAs(failed->second, std::move(effect));
  }
  tell(effects);
  return effects;
}

Stage::Effects Stage::foretold(const Act& act) {
  auto effects = _foretold.during([&] { act(_players.machine); });
  for (auto& effect : effects) effect = inViewOfState(std::move(effect));
  return effects;
}

void Stage::tell(const Effects& effects) {
  for (const auto& effect : effects) {
    remember(effect);
    _audience.record(effect);
  }
}

/// The machine knows nothing of what was rehearsed before.
Effect Stage::inViewOfState(Effect effect) const {
  const bool wouldFail = effect.outcome == Outcome::unchanged && effect.failure;
  const auto state = stateOf(effect.setting);
  if (!state || !effect.asked || effect.outcome == Outcome::notSupported) {
    if (wouldFail) effect.failure.reset();
    return effect;
  }
  effect.before = state->live ? state->live : state->stored;
  if (state->asked == *effect.asked) {
    effect.outcome = Outcome::unchanged;
    effect.failure.reset();
  } else {
    effect.outcome = effect.failure ? Outcome::failed : Outcome::applied;
  }
  effect.changed = effect.outcome == Outcome::applied;
  if (effect.outcome == Outcome::applied) return effect;
  effect.live = state->live;
  if (!isStored(effect)) effect.stored = state->stored;
  return effect;
}

void Stage::remember(const Effect& effect) {
  const bool isSetting = effect.asked && (effect.live || effect.stored);
  if (!isSetting) return;
  if (effect.outcome == Outcome::applied)
    _states[effect.setting] = {*effect.asked, effect.live, effect.stored};
  else if (effect.outcome == Outcome::failed && isStored(effect))
    _states[effect.setting] = {"", effect.live, effect.stored};
}

std::optional<Stage::State> Stage::stateOf(const std::string& setting) const {
  const auto state = _states.find(setting);
  return state == _states.end() ? std::nullopt : std::optional(state->second);
}

void Stage::refuse(const Effects& effects) {
  const auto now = _players.copyFile.contents();
  const auto* section = now->find("Refusals");
  auto refusals = section ? *section->asDictionary() : PropertyList::Dictionary();
  for (const auto& effect : effects) {
    if (!effect.asked) continue;
    if (isRefused(effect) && effect.failure)
      refusals.set(effect.setting, refusalTelling(*effect.failure));
    else
      refusals.remove(effect.setting);
  }
  if (refusals == (section ? *section->asDictionary() : PropertyList::Dictionary())) return;
  edit([&](PropertyList::Dictionary& machine) { machine.set("Refusals", std::move(refusals)); });
}

void Stage::edit(const MachineFile::Edit& edit) {
  const auto written = _players.copyFile.change(edit);
  if (!written) _audience.recordFailure("Machine", written.failure());
}

/// What a getter of the copy could not read is told as it is; what became of a change the machine tells.
void Stage::record(const Effect& effect) {
  if (!_isPlaying) return _audience.record(effect);
  if (effect.outcome == Outcome::failed && effect.failure) _copyFailures.insert_or_assign(effect.setting, effect);
}

void Stage::observe(const SettingValue& value) {
  _audience.observe(value);
}

}  // namespace tavisk
