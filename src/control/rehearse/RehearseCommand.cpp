// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <optional>
#include <set>
#include <string>
#include <utility>

#include "control/Commands.h"
#include "control/Ending.h"
#include "control/apply/Applier.h"
#include "control/apply/ApplyPlan.h"
#include "control/rehearse/Rehearsal.h"
#include "control/rehearse/RehearsalFolder.h"

namespace tavisk::control {
namespace {

constexpr const char* from = "--from";
constexpr const char* keep = "--keep";

/// Words, or the steps of a file.
struct Part {
  std::vector<std::string> words;
  std::vector<Step> steps;
};

Result<Part> askedPart(const Invocation& invocation) {
  const bool isFile = invocation.has(from);
  if (isFile != invocation.operands.empty())
    return Failure{"either words of tavisk or --from FILE are expected", "", "type 'taviskctl rehearse --help'"};
  if (!isFile) return Part{invocation.operands, {}};
  const auto wanted = wantedInFile(invocation.options.at(from));
  if (!wanted) return wanted.failure();
  return Part{{}, stepsFor(*wanted)};
}

std::optional<std::string> keptFolder(const Invocation& invocation) {
  return invocation.has(keep) ? std::optional(invocation.options.at(keep)) : std::nullopt;
}

Rehearsed rehearsedOn(const Part& part, Applier& applier, WordRunner& runner, RehearsalNotes& notes) {
  if (!part.words.empty()) {
    auto all = rehearseWords(part.words, runner);
    all.settings = notes.settings();
    return all;
  }
  Rehearsed all;
  for (const auto& step : part.steps)
    for (const auto& applied : applier.apply(step)) all.settings.push_back(rehearsed(applied, notes));
  return all;
}

Status show(const Rehearsed& rehearsed, const Invocation& invocation, const Tools& tools) {
  const auto folder = keptFolder(invocation).value_or("");
  const bool areAllDone = isAllDone(rehearsed, invocation);
  const auto text =
      invocation.has("--json") ? rehearsedJson(rehearsed, areAllDone, folder) + "\n" : rehearsedTable(rehearsed);
  return endWith(text, areAllDone ? Status::done : Status::incomplete, tools);
}

/// What is kept has the files that the search for startup disks looks at.
void searchStartupDisks(WordRunner& runner) {
  for (const auto* const word : {"-liststartupdisks", "-getstartupdisk"}) {
    const std::string words[] = {word};
    runner.run(words);
  }
}

/// What could not be read of the machine is told once, and not rehearsed.
class LookFailures final : public EffectChannel {
 public:
  explicit LookFailures(const Tools& tools) : _tools(tools) {}

  void record(const Effect& effect) override {
    if (!effect.failure) return;
    const auto line = "not read: " + effect.setting + ": " + describe(*effect.failure);
    if (_told.insert(line).second) _tools.complain(line);
  }

 private:
  const Tools& _tools;
  std::set<std::string> _told;
};

}  // namespace

Status rehearseChanges(const Invocation& invocation, const Tools& tools) {
  const auto part = askedPart(invocation);
  if (!part) return endBy(part.failure(), Status::misused, tools);
  if (const auto kept = keptFolder(invocation))
    if (const auto checked = tools.checkPlaceOfCopy(*kept); !checked)
      return endBy(checked.failure(), Status::incomplete, tools);
  const EndingSignals signals;
  const auto folder = RehearsalFolder::make(keptFolder(invocation));
  if (!folder) return endBy(folder.failure(), Status::incomplete, tools);
  const auto waiter = endBySignal(
      signals, [&](const std::string&) { folder->removeTemporary(); }, tools);
  EffectSink effects;
  LookFailures failures(tools);
  StatusReader reader;
  RehearsalNotes notes;
  RunLoop runLoop;
  effects.addChannel(failures);
  std::optional<ProgressLine> progress(std::in_place, tools.showProgress, "Copying the machine ...");
  const auto host = tools.openRehearsal(folder->path(), invocation.has(keep), effects, runLoop);
  if (!host) return endBy(host.failure(), Status::incomplete, tools);
  WordRunner runner(**host, effects, runLoop);
  if (const auto started = runner.start(); !started) return endBy(started.failure(), Status::incomplete, tools);
  if (invocation.has(keep)) searchStartupDisks(runner);
  progress.reset();
  effects.removeChannel(failures);
  effects.addChannel(reader);
  effects.addChannel(notes);
  Applier applier(**host, runner, reader);
  if (isLockoutRefused(part->steps, applier, invocation, tools)) return Status::incomplete;
  return show(rehearsedOn(*part, applier, runner, notes), invocation, tools);
}

}  // namespace tavisk::control
