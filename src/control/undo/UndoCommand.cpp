// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <ctime>
#include <memory>
#include <utility>

#include "control/Commands.h"
#include "control/Ending.h"
#include "control/apply/Applier.h"
#include "control/undo/SinceTime.h"
#include "control/undo/UndoPlan.h"
#include "control/undo/UndoText.h"

namespace tavisk::control {
namespace {

using Since = std::optional<std::int64_t>;

/// Absent: what the last run has done is meant.
Result<Since> sinceOf(const Invocation& invocation) {
  if (!invocation.has("--since")) return Since();
  if (invocation.has("--last")) return Failure{"either --since or --last is expected", "", "both are given"};
  const auto& text = invocation.options.at("--since");
  const auto since = timeMeantBy(text, std::time(nullptr));
  if (!since) return Failure{"--since " + text, "", "\"2026-11-22 14:30\", today, -2h or the like is expected"};
  return since;
}

std::vector<WantedSetting> wantedOf(std::span<const UndoResult> results) {
  std::vector<WantedSetting> wanted;
  for (const auto& [planned, outcome] : results)
    if (planned.step == UndoStep::set) wanted.push_back({planned.managed, *planned.back});
  return wanted;
}

bool isToDo(const UndoResult& result) {
  return result.planned.step == UndoStep::set || result.planned.step == UndoStep::reset;
}

/// A machine, and what takes back changes on it.
class Undoing final {
 public:
  /// Nothing is owned.
  Undoing(const Tools& tools, Host& host, EffectSink& effects, RunLoop& runLoop)
      : _tools(tools), _host(host), _runLoop(runLoop), _runner(host, effects, runLoop) {
    effects.addChannel(_reader);
  }

  /// The waiter goes before this does.
  std::unique_ptr<SignalWaiter> endBySignal(const EndingSignals& signals) {
    return control::endBySignal(
        signals, [this](const std::string& signal) { _runner.endedBySignal(signal); }, _tools);
  }

  std::vector<UndoResult> plan(const std::vector<RecordedChange>& changes, UndoConsent consent) {
    const auto states = _reader.read(settingsOf(changes), _host, _runLoop);
    std::vector<UndoResult> results;
    for (auto& planned : planUndo(changes, states, consent)) results.push_back({std::move(planned)});
    return results;
  }

  /// The failure says why nothing was done.
  Result<void> carryOut(std::vector<UndoResult>& results) {
    if (std::ranges::none_of(results, isToDo)) return {};
    if (auto started = _runner.start(); !started) return started;
    Applier applier(_host, _runner, _reader);
    for (const auto& step : stepsFor(wantedOf(results))) take(results, step, applier);
    for (auto& result : results)
      if (result.planned.step == UndoStep::reset) reset(result, applier);
    return {};
  }

 private:
  void take(std::vector<UndoResult>& results, const Step& step, Applier& applier) {
    const auto name = step.asked.front().setting->name;
    const ProgressLine progress(_tools.showProgress, std::string(name) + " ...");
    const auto result = std::ranges::find(results, name, [](const auto& of) { return of.planned.setting; });
    result->outcome = applier.apply(step).front();
  }

  /// What others keep of the setting comes to light.
  void reset(UndoResult& result, Applier& applier) {
    const auto& planned = result.planned;
    const ProgressLine progress(_tools.showProgress, planned.setting + " ...");
    auto outcome = applier.reset(*planned.managed);
    const auto back = planned.back.value_or("");
    if (outcome.verdict <= Verdict::applied && outcome.after.value_or("") != back) {
      outcome.verdict = Verdict::failed;
      outcome.reason = describe({"read back", planned.setting, "reads " + *outcome.after});
    }
    result.outcome = std::move(outcome);
  }

  const Tools& _tools;
  Host& _host;
  RunLoop& _runLoop;
  StatusReader _reader;
  WordRunner _runner;
};

bool isWhole(const UndoResult& result) {
  if (result.outcome) return result.outcome->verdict <= Verdict::applied && result.outcome->lasts;
  return isToDo(result) || result.planned.step == UndoStep::there;
}

Status undo(const RecordedChanges& recorded, Since since, Undoing& undoing, const Invocation& invocation,
            const Tools& tools) {
  const bool isRun = invocation.has("--run");
  auto results = undoing.plan(chosenChanges(recorded.changes, since),
                              {invocation.has("--force"), invocation.has("--allow-lockout")});
  for (const auto& remark : recorded.remarks) tools.complain(remark);
  if (isRun)
    if (const auto done = undoing.carryOut(results); !done) return endBy(done.failure(), Status::incomplete, tools);
  const auto text = invocation.has("--json") ? undoJson(results, recorded.remarks) + '\n' : undoTable(results, isRun);
  return endWith(text, std::ranges::all_of(results, isWhole) ? Status::done : Status::incomplete, tools);
}

}  // namespace

Status undoChanges(const Invocation& invocation, const Tools& tools) {
  const auto since = sinceOf(invocation);
  if (!since) return endBy(since.failure(), Status::misused, tools);
  const bool isRun = invocation.has("--run");
  const EndingSignals signals;
  if (!isRun) signals.unblock();
  EffectSink effects;
  RunLoop runLoop;
  const auto host = tools.openHost(effects, runLoop);
  if (!host) return endBy(host.failure(), Status::incomplete, tools);
  const auto recorded = (*host)->history().changes();
  if (!recorded) return endBy(recorded.failure(), Status::incomplete, tools);
  Undoing undoing(tools, **host, effects, runLoop);
  const auto waiter = isRun ? undoing.endBySignal(signals) : nullptr;
  return undo(*recorded, *since, undoing, invocation, tools);
}

}  // namespace tavisk::control
