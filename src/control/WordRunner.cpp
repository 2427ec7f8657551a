// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/WordRunner.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "base/Process.h"
#include "base/Text.h"

namespace tavisk::control {

const char* nameOf(Verdict verdict) {
  switch (verdict) {
    case Verdict::unchanged:
      return nameOf(Outcome::unchanged);
    case Verdict::applied:
      return nameOf(Outcome::applied);
    case Verdict::notSupported:
      return nameOf(Outcome::notSupported);
    case Verdict::failed:
      return nameOf(Outcome::failed);
    case Verdict::refused:
      break;
  }
  return "refused";
}

Verdict verdictOf(const Effect& effect) {
  switch (effect.outcome) {
    case Outcome::unchanged:
      return Verdict::unchanged;
    case Outcome::applied:
      return Verdict::applied;
    case Outcome::notSupported:
      return Verdict::notSupported;
    case Outcome::failed:
      break;
  }
  return Verdict::failed;
}

Verdict verdictOf(const WordResult& result) {
  if (result.refused) return Verdict::refused;
  if (result.brokenOffBy) return Verdict::failed;
  auto worst = Verdict::unchanged;
  for (const auto& effect : result.effects) worst = std::max(worst, verdictOf(effect));
  return worst == Verdict::unchanged && result.hasRaisedFlag ? Verdict::failed : worst;
}

std::string reasonOf(const WordResult& result) {
  const auto verdict = verdictOf(result);
  if (result.refused) return "expected is " + *result.refused;
  if (result.brokenOffBy) return *result.brokenOffBy;
  if (verdict < Verdict::notSupported) return {};
  const auto worst = std::ranges::find_if(
      result.effects, [&](const Effect& effect) { return verdictOf(effect) == verdict && effect.failure; });
  return worst != result.effects.end() ? describe(*worst->failure) : escaped(trimmed(result.printed));
}

WordRunner::WordRunner(Host& host, EffectSink& effects, RunLoop& runLoop)
    : _effects(effects), _frame(host, runLoop), _settings(_frame.context(), effects, &_gatherer) {
  _effects.addChannel(_gatherer);
}

WordRunner::~WordRunner() {
  doStep([this] { _settings.deauthenticate(); });
  _effects.removeChannel(_gatherer);
}

Result<void> WordRunner::start() {
  const bool isStarted = _settings.startWithoutLoop();
  const auto result = _gatherer.take();
  if (isStarted) return {};
  return Failure{"run words of tavisk", "", result.brokenOffBy.value_or(std::string(trimmed(result.printed)))};
}

WordResult WordRunner::run(std::span<const std::string> words) {
  const auto taken = _settings.runOne(words);
  auto result = _gatherer.take();
  const auto own = words.first(std::min(taken.value_or(1), words.size()));
  result.words.assign(own.begin(), own.end());
  result.isLast = !taken;
  return result;
}

WordResult WordRunner::run(const std::function<void(Host& host)>& act) {
  static_cast<void>(_gatherer.take());
  const auto& context = _frame.context();
  const auto limit = context.runLoop.limitWaits(context.longestCommand);
  std::optional<std::string> brokenOffBy;
  try {
    act(context.host);
  } catch (const std::exception& error) {
    brokenOffBy.emplace(tavisk::reasonOf(error));
    _effects.interrupt(*brokenOffBy);
  }
  _effects.commandEnds();
  auto result = _gatherer.take();
  result.brokenOffBy = std::move(brokenOffBy);
  return result;
}

WordResult WordRunner::Gatherer::take() {
  const std::scoped_lock lock(_mutex);
  return std::exchange(_result, {});
}

void WordRunner::Gatherer::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  _result.effects.push_back(effect);
}

void WordRunner::Gatherer::observe(const SettingValue& value) {
  const std::scoped_lock lock(_mutex);
  _result.values.push_back(value);
}

void WordRunner::Gatherer::commandBegins(const std::string& /*command*/, std::span<const std::string> /*arguments*/,
                                         const std::string& /*handler*/) {}

void WordRunner::Gatherer::argumentRefused(const std::string& expected) {
  const std::scoped_lock lock(_mutex);
  _result.refused = expected;
}

void WordRunner::Gatherer::commandEnds(bool failed, const std::string& output) {
  end(failed, output);
}

void WordRunner::Gatherer::wordRefused(const std::string& /*word*/, bool failed, const std::string& output) {
  argumentRefused(wordExpected);
  end(failed, output);
}

void WordRunner::Gatherer::runRefused(const std::string& error, const std::string& output) {
  end(true, output);
  const std::scoped_lock lock(_mutex);
  _result.brokenOffBy = error;
}

void WordRunner::Gatherer::runEndedBySignal(const std::string& signal, bool failed, const std::string& output) {
  end(failed, output);
  const std::scoped_lock lock(_mutex);
  _result.brokenOffBy = signal;
}

void WordRunner::Gatherer::end(bool failed, const std::string& output) {
  const std::scoped_lock lock(_mutex);
  _result.hasRaisedFlag = failed && !_isFlagUp;
  _result.isFlagUp = failed;
  _isFlagUp = failed;
  _result.printed += output;
}

}  // namespace tavisk::control
