// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/SettingReset.h"

namespace tavisk {

OwnPart ownKey(const PropertyListFile& file, const std::string& key) {
  const auto isThere = [&file, key]() -> Result<bool> {
    const auto contents = file.read();
    if (!contents) return contents.failure();
    return *contents && (*contents)->find(key);
  };
  return {.isThere = isThere, .check = nullptr, .takeAway = [&file, key](WrittenPlaces& taken) {
            return file.removeKey(key, taken);
          }};
}

namespace change {
namespace {

constexpr const char* nothingOwn = "tavisk stores nothing of it";
constexpr const char* staysInForce = "what is in force stays until the machine is started again";

/// One reset under way: the steps, and the effect that they fill in.
class Reset {
 public:
  explicit Reset(const ResetSteps& steps) : _steps(steps) {
    _effect.setting = steps.name;
    _effect.asked = resetAsked;
  }

  const Effect& effect() const { return _effect; }

  bool isNeeded() {
    lookBefore();
    const auto isThere = _steps.own.isThere();
    if (!isThere) fail(isThere.failure());
    if (isThere && !*isThere) {
      _effect.outcome = Outcome::unchanged;
      _effect.note = nothingOwn;
    }
    return isThere && *isThere;
  }

  bool isAllowed() {
    const auto allowed = _steps.own.check ? _steps.own.check() : Result<void>();
    if (!allowed) fail(allowed.failure());
    return static_cast<bool>(allowed);
  }

  void foretell() { _effect.changed = true; }

  void carryOut(RunLoop& runLoop) {
    WrittenPlaces taken;
    const auto away = _steps.own.takeAway(taken);
    _effect.where = taken.text();
    _effect.changed = away || !_effect.where.empty();
    if (!away) fail(away.failure());
    if (_lack)
      _effect.note = "this machine cannot have the setting: " + describe(*_lack);
    else
      putIntoForce(static_cast<bool>(away), runLoop);
    if (_effect.failure) _effect.note.clear();
  }

 private:
  /// A value that cannot be read is not a reason against it.
  void lookBefore() {
    const auto support = _steps.supported ? _steps.supported() : Support(std::nullopt);
    if (support && *support) _lack = (*support)->reason;
    _effect.isBeforeKnown = !_lack;
    if (_lack) return;
    const auto live = lookAt(_steps.live);
    const auto stored = lookAt(_steps.stored);
    const auto& before = _steps.live ? live : stored;
    _effect.live = live.valueOr(std::nullopt);
    _effect.stored = stored.valueOr(std::nullopt);
    _effect.before = before.valueOr(std::nullopt);
    _effect.isBeforeKnown = static_cast<bool>(before);
  }

  void putIntoForce(bool isTakenAway, RunLoop& runLoop) {
    const auto followed = isTakenAway ? _steps.follow() : Result<bool>(true);
    if (!followed) fail(followed.failure());
    if (followed && !*followed) _effect.note = staysInForce;
    if (isTakenAway && followed && _steps.settled &&
        !runLoop.runUntil(RunLoop::Clock::now() + longestSettling, _steps.settled))
      fail({"change", _steps.name, "did not settle in time", std::make_error_code(std::errc::timed_out)});
    readBack(isTakenAway);
  }

  void readBack(bool isTakenAway) {
    _effect.live = lookAgain(_steps.live);
    _effect.stored = lookAgain(_steps.stored);
    if (!isTakenAway) return;
    const auto hasFollowed = _steps.hasFollowed();
    if (!hasFollowed) return fail(hasFollowed.failure());
    if (!*hasFollowed)
      return fail({"read back", _steps.name, _effect.live ? "reads " + *_effect.live : "reads nothing"});
    const bool isLate = _effect.failure && _effect.failure->code == std::errc::timed_out;
    if (isLate && (!_steps.settled || _steps.settled())) {
      _effect.outcome = Outcome::applied;
      _effect.failure.reset();
    }
  }

  /// The first failure is the cause; what follows from it is not told.
  void fail(const Failure& failure) {
    _effect.outcome = Outcome::failed;
    if (!_effect.failure) _effect.failure = failure;
  }

  static Result<std::optional<std::string>> lookAt(const ResetSteps::Look& look) {
    return look ? look() : Result<std::optional<std::string>>(std::nullopt);
  }

  std::optional<std::string> lookAgain(const ResetSteps::Look& look) {
    auto seen = lookAt(look);
    if (!seen) fail(seen.failure());
    return seen ? std::move(seen).value() : std::nullopt;
  }

  const ResetSteps& _steps;
  Effect _effect;
  std::optional<Failure> _lack;  ///< why the machine cannot have the setting
};

}  // namespace

Effect reset(const ResetSteps& steps, EffectSink& effects, RunLoop& runLoop, Conduct conduct) {
  Reset reset(steps);
  if (reset.isNeeded() && reset.isAllowed()) {
    if (conduct == Conduct::forecast) {
      reset.foretell();
    } else {
      effects.changeBegins(steps.name, resetAsked);
      reset.carryOut(runLoop);
    }
  }
  effects.record(reset.effect());
  return reset.effect();
}

}  // namespace change
}  // namespace tavisk
