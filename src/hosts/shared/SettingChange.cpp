// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/SettingChange.h"

namespace tavisk::change {
namespace {

/// One change under way: the steps of carryOut() and the effect that they fill in.
class Change {
 public:
  explicit Change(const Steps& steps) : _steps(steps) {
    _effect.setting = steps.name;
    _effect.asked = steps.asked;
    _effect.where = steps.where;
    if (steps.undoneBy) _effect.undoneBy = steps.undoneBy();
    if (steps.note) _effect.note = steps.note();
  }

  const Effect& effect() const { return _effect; }

  bool isSupported() {
    const auto support = _steps.supported ? _steps.supported() : Support(std::nullopt);
    if (support && !*support) return true;
    _effect.outcome = support ? Outcome::notSupported : Outcome::failed;
    _effect.failure = support ? (*support)->reason : support.failure();
    return false;
  }

  /// Whether something is to be written. A value that cannot be read is not a reason against it: what counts is read
  /// back afterwards.
  bool isNeeded() {
    const bool isLiveThere = isThere(_steps.live, _effect.live);
    const bool isStoredThere = isThere(_steps.stored, _effect.stored);
    _effect.before = _steps.live ? _effect.live : _effect.stored;
    const bool isRead = _steps.live || _steps.stored;
    _effect.outcome = isRead && isLiveThere && isStoredThere ? Outcome::unchanged : Outcome::applied;
    return _steps.always || _effect.outcome == Outcome::applied;
  }

  void write(RunLoop& runLoop) {
    if (!succeeds(_steps.store) || !succeeds(_steps.apply) || !_steps.settled) return;
    if (runLoop.runUntil(RunLoop::Clock::now() + longestSettling, _steps.settled)) return;
    fail({"change", _steps.name, "did not settle in time"});
  }

  void readBack() {
    readBack(_steps.live, _effect.live, _steps.name);
    readBack(_steps.stored, _effect.stored, _steps.where.empty() ? _steps.name : _steps.where);
  }

 private:
  static constexpr std::chrono::seconds longestSettling{3};

  /// The first failure is the cause; what follows from it is not told.
  void fail(const Failure& failure) {
    _effect.outcome = Outcome::failed;
    if (!_effect.failure) _effect.failure = failure;
  }

  static bool isThere(const std::function<Result<Sight>()>& look, std::optional<std::string>& text) {
    if (!look) return true;
    const auto seen = look().valueOr({});
    text = seen.text;
    return seen.isAsked;
  }

  bool succeeds(const std::function<Result<void>()>& write) {
    const auto written = write ? write() : Result<void>();
    if (!written) fail(written.failure());
    return static_cast<bool>(written);
  }

  void readBack(const std::function<Result<Sight>()>& look, std::optional<std::string>& text,
                const std::string& place) {
    if (!look) return;
    const auto seen = look();
    text = seen.valueOr({}).text;
    if (!seen) return fail(seen.failure());
    if (!seen->isAsked) fail({"read back", place, text ? "reads " + *text : "reads nothing"});
  }

  const Steps& _steps;
  Effect _effect;
};

}  // namespace

Effect carryOut(const Steps& steps, EffectSink& effects, RunLoop& runLoop) {
  Change change(steps);
  if (change.isSupported() && change.isNeeded()) {
    effects.changeBegins(steps.name, steps.asked);
    change.write(runLoop);
    change.readBack();
  }
  effects.record(change.effect());
  return change.effect();
}

}  // namespace tavisk::change
