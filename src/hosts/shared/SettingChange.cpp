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
    _live = lookAt(_steps.live, _effect.live);
    _stored = lookAt(_steps.stored, _effect.stored);
    _effect.before = _steps.live ? _effect.live : _effect.stored;
    const bool isThere = isRead() && (!_steps.live || isAsked(_live)) && (!_steps.stored || isAsked(_stored));
    _effect.outcome = isThere ? Outcome::unchanged : Outcome::applied;
    return _steps.always || _effect.outcome == Outcome::applied;
  }

  void write(RunLoop& runLoop) {
    if (!succeeds(_steps.store) || !succeeds(_steps.apply) || !_steps.settled) return;
    if (runLoop.runUntil(RunLoop::Clock::now() + longestSettling, _steps.settled)) return;
    fail({"change", _steps.name, "did not settle in time"});
  }

  void readBack() {
    if (!isRead()) _effect.changed = _isWritten;
    readBack(_steps.live, _live, _effect.live, _steps.name);
    readBack(_steps.stored, _stored, _effect.stored, _steps.where.empty() ? _steps.name : _steps.where);
  }

 private:
  using Look = std::function<Result<Sight>()>;
  using Before = std::optional<Sight>;  ///< absent: there was nothing to look at, or the look failed

  static constexpr std::chrono::seconds longestSettling{3};

  bool isRead() const { return _steps.live || _steps.stored; }
  static bool isAsked(const Before& sight) { return sight && sight->isAsked; }

  /// The first failure is the cause; what follows from it is not told.
  void fail(const Failure& failure) {
    _effect.outcome = Outcome::failed;
    if (!_effect.failure) _effect.failure = failure;
  }

  static Before lookAt(const Look& look, std::optional<std::string>& text) {
    const auto seen = look ? look() : Result<Sight>(Sight());
    if (!look || !seen) return std::nullopt;
    text = seen->text;
    return *seen;
  }

  bool succeeds(const std::function<Result<void>()>& write) {
    const auto written = write ? write() : Result<void>();
    if (!written) fail(written.failure());
    // Who does not answer may do it all the same.
    _isWritten = _isWritten || (write && (written || written.failure().code == std::errc::timed_out));
    return static_cast<bool>(written);
  }

  /// What was not seen before or is not seen now counts as changed when something was written.
  void readBack(const Look& look, const Before& before, std::optional<std::string>& text, const std::string& place) {
    if (!look) return;
    const auto seen = look();
    text = seen ? seen->text : std::nullopt;
    const bool differs = before && seen ? before->text != seen->text : _isWritten;
    _effect.changed = _effect.changed || differs;
    if (!seen) return fail(seen.failure());
    if (!seen->isAsked) fail({"read back", place, text ? "reads " + *text : "reads nothing"});
  }

  const Steps& _steps;
  Effect _effect;
  Before _live;
  Before _stored;
  bool _isWritten = false;  ///< a step that writes has succeeded
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
