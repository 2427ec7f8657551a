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
    _effect.isBeforeKnown = _steps.live ? _live.has_value() : _stored.has_value() || !_steps.stored;
    const bool isThere = isRead() && (!_steps.live || isAsked(_live)) && (!_steps.stored || isAsked(_stored));
    _effect.outcome = isThere ? Outcome::unchanged : Outcome::applied;
    return _steps.always || _effect.outcome == Outcome::applied;
  }

  void write(RunLoop& runLoop) {
    const bool isStored = isTaken() && succeeds(_steps.store);
    const bool isApplied = isStored && succeeds(_steps.apply);
    if (isApplied && _steps.settled && !runLoop.runUntil(RunLoop::Clock::now() + longestSettling, _steps.settled))
      fail({"change", _steps.name, "did not settle in time", std::make_error_code(std::errc::timed_out)});
    tellPlaces(_steps.store ? isStored : isApplied);
  }

  /// What write() and readBack() would find.
  void foresee(bool isNeeded) {
    foreseeSteps();
    if (!isNeeded) _effect.outcome = Outcome::unchanged;
  }

  void readBack() {
    look();
    if (_effect.outcome == Outcome::failed && hasEndedAfterAll()) {
      _effect.outcome = Outcome::applied;
      _effect.failure.reset();
      tellPlaces(true);
    }
    if (_effect.outcome == Outcome::failed && _isWritten && _steps.takeBack) takeBack();
  }

  void remark() {
    if (_steps.undoneBy) _effect.undoneBy = _steps.undoneBy();
    const bool isAsAsked = _effect.outcome == Outcome::applied || _effect.outcome == Outcome::unchanged;
    if (_steps.note && isAsAsked) _effect.note = _steps.note();
  }

 private:
  using Look = std::function<Result<Sight>()>;
  using Before = std::optional<Sight>;  ///< absent: there was nothing to look at, or the look failed

  bool isRead() const { return _steps.live || _steps.stored; }

  bool isTaken() {
    const auto taken = _steps.check ? _steps.check() : Result<void>();
    if (!taken) fail(taken.failure());
    return static_cast<bool>(taken);
  }

  void foreseeSteps() {
    if (!isTaken()) return;
    if (_steps.stored) become(_effect.stored, _steps.asked);
    _effect.where = _steps.where;
    const auto applied = _steps.foresee ? _steps.foresee() : Result<void>();
    if (!applied) return fail(applied.failure());
    if (_steps.live) become(_effect.live, _steps.askedLive);
    if (!isRead()) _effect.changed = !_steps.leavesNoTrace;
  }

  void become(std::optional<std::string>& text, const std::string& value) {
    _effect.changed = _effect.changed || text != value;
    text = value;
  }

  void tellPlaces(bool areAllWritten) {
    _effect.where = _steps.written ? _steps.written() : areAllWritten ? _steps.where : "";
  }

  void takeBack() {
    const auto takenBack = _steps.takeBack();
    if (takenBack) {
      _effect.where.clear();
    } else {
      _effect.failure->why += "; what was stored is still there: " + describe(takenBack.failure());
    }
    _effect.changed = false;
    look();
  }

  void look() {
    if (!isRead()) _effect.changed = _isWritten && !_steps.leavesNoTrace;
    _isAsAsked = isRead();
    readBack(_steps.live, _live, _effect.live, _steps.name);
    readBack(_steps.stored, _stored, _effect.stored, _steps.where.empty() ? _steps.name : _steps.where);
  }

  /// Whether what ran out of time has come about meanwhile.
  bool hasEndedAfterAll() const {
    return _effect.failure->code == std::errc::timed_out && _isAsAsked && (!_steps.settled || _steps.settled());
  }

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
    _isAsAsked = _isAsAsked && seen && seen->isAsked;
    if (!seen) return fail(seen.failure());
    if (!seen->isAsked) fail({"read back", place, text ? "reads " + *text : "reads nothing"});
  }

  const Steps& _steps;
  Effect _effect;
  Before _live;
  Before _stored;
  bool _isWritten = false;  ///< a step that writes has succeeded
  bool _isAsAsked = false;  ///< what was looked at last
};

}  // namespace

Effect carryOut(const Steps& steps, EffectSink& effects, RunLoop& runLoop) {
  Change change(steps);
  if (change.isSupported() && change.isNeeded()) {
    effects.changeBegins(steps.name, steps.asked);
    change.write(runLoop);
    change.readBack();
  }
  change.remark();
  effects.record(change.effect());
  return change.effect();
}

Effect foretell(const Steps& steps, EffectSink& effects) {
  Change change(steps);
  if (change.isSupported()) {
    const bool isNeeded = change.isNeeded();
    change.foresee(isNeeded);
  }
  change.remark();
  effects.record(change.effect());
  return change.effect();
}

}  // namespace tavisk::change
