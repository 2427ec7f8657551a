// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/SettingChange.h"

#include <utility>

namespace tavisk {
namespace {

using Value = std::optional<std::string>;

/// One change under way: the steps of carryOut() and the effect that they fill in.
class Change {
 public:
  Change(const Setting& setting, const std::string& asked)
      : _setting(setting), _asked(asked), _askedLive(setting.liveFor ? setting.liveFor(asked) : asked) {
    _effect.setting = setting.name;
    _effect.asked = asked;
    _effect.where = setting.where;
    _effect.undoneBy = setting.undoneBy;
    _effect.note = setting.note;
  }

  const Effect& effect() const { return _effect; }

  bool isSupported() {
    std::optional<Failure> reason = _setting.supported ? _setting.supported() : std::nullopt;
    if (!reason) return true;
    _effect.outcome = Outcome::notSupported;
    _effect.failure = std::move(reason);
    return false;
  }

  /// Whether something is to be written. A value that cannot be read is not a reason against it: what counts is read
  /// back afterwards.
  bool isNeeded() {
    const bool isLiveThere = hasValue(_setting.live, _askedLive, _effect.live);
    const bool isStoredThere = hasValue(_setting.stored, _asked, _effect.stored);
    _effect.before = _setting.live ? _effect.live : _effect.stored;
    const bool isRead = _setting.live || _setting.stored;
    _effect.outcome = isRead && isLiveThere && isStoredThere ? Outcome::unchanged : Outcome::applied;
    return _setting.always || _effect.outcome == Outcome::applied;
  }

  void write(RunLoop& runLoop) {
    if (!succeeds(_setting.store) || !succeeds(_setting.apply) || !_setting.settled) return;
    const auto isSettled = [this] { return _setting.settled(_asked); };
    if (runLoop.runUntil(RunLoop::Clock::now() + longestSettling, isSettled)) return;
    fail({"change", _setting.name, "did not settle in time"});
  }

  void readBack() {
    readBack(_setting.live, _askedLive, _effect.live, _setting.name);
    readBack(_setting.stored, _asked, _effect.stored, _setting.where.empty() ? _setting.name : _setting.where);
  }

 private:
  static constexpr std::chrono::seconds longestSettling{3};

  /// The first failure is the cause; what follows from it is not told.
  void fail(const Failure& failure) {
    _effect.outcome = Outcome::failed;
    if (!_effect.failure) _effect.failure = failure;
  }

  static bool hasValue(const Setting::Read& read, const std::string& wanted, Value& value) {
    if (!read) return true;
    const Result<Value> found = read();
    value = found.valueOr(std::nullopt);
    return found && value.value_or("") == wanted;
  }

  bool succeeds(const Setting::Write& write) {
    const Result<void> written = write ? write(_asked) : Result<void>();
    if (!written) fail(written.failure());
    return static_cast<bool>(written);
  }

  void readBack(const Setting::Read& read, const std::string& wanted, Value& value, const std::string& place) {
    if (!read) return;
    const Result<Value> found = read();
    value = found.valueOr(std::nullopt);
    if (!found) return fail(found.failure());
    if (value.value_or("") != wanted) fail({"read back", place, value ? "reads " + *value : "reads nothing"});
  }

  const Setting& _setting;
  const std::string& _asked;
  const std::string _askedLive;
  Effect _effect;
};

}  // namespace

Effect carryOut(const Setting& setting, const std::string& asked, EffectSink& effects, RunLoop& runLoop) {
  Change change(setting, asked);
  if (change.isSupported() && change.isNeeded()) {
    effects.changeBegins(setting.name, asked);
    change.write(runLoop);
    change.readBack();
  }
  effects.record(change.effect());
  return change.effect();
}

std::optional<std::string> observe(const Setting& setting, EffectSink& effects) {
  const Result<Value> found = setting.live ? setting.live() : setting.stored();
  if (!found) {
    Effect effect;
    effect.setting = setting.name;
    effect.outcome = Outcome::failed;
    effect.where = setting.where;
    effect.failure = found.failure();
    effects.record(effect);
    return std::nullopt;
  }
  SettingValue value{setting.name, std::nullopt, std::nullopt, setting.unit};
  (setting.live ? value.live : value.stored) = *found;
  effects.observe(value);
  return *found;
}

}  // namespace tavisk
