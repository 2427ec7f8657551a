// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/Rehearsal.h"

#include <algorithm>
#include <utility>

#include "base/Text.h"
#include "control/ManagedSettings.h"
#include "control/SilentFrame.h"

namespace tavisk::control {
namespace {

constexpr const char* notRehearsed = "the startup disk is not rehearsed";

std::string unitOf(const std::string& name) {
  const auto setting = std::ranges::find(managedSettings(), name, &ManagedSetting::name);
  if (setting == managedSettings().end()) return {};
  switch (setting->kind) {
    case ValueKind::moment:
      return "seconds since 1970";
    case ValueKind::minutes:
      return "minutes";
    case ValueKind::startupDelay:
      return "units of 30 seconds";
    default:
      return {};
  }
}

std::string withDash(const std::string& word) {
  const auto typed = lowerCased(word);
  return typed.starts_with('-') ? typed : "-" + typed;
}

void addOnce(std::vector<std::string>& texts, const std::string& text) {
  if (!text.empty() && std::ranges::find(texts, text) == texts.end()) texts.push_back(text);
}

/// What is done without any value, as when a daemon is told to read its files again, is no setting of the machine.
bool isOfInterest(const Effect& effect) {
  return effect.asked && (effect.failure || effect.before || effect.live || effect.stored);
}

WordResult unrehearsed(std::span<const std::string> words, const CommandTable& table) {
  const auto* entry = table.findTyped(words.front());
  const std::size_t taken = entry ? static_cast<std::size_t>(entry->arguments) + 1 : 1;
  const auto own = words.first(std::min(taken, words.size()));
  WordResult result{.words = {own.begin(), own.end()}};
  Effect effect{.setting = "Startup Disk", .outcome = Outcome::notSupported};
  effect.failure = Failure{"rehearse", words.front(), notRehearsed};
  result.effects.push_back(std::move(effect));
  return result;
}

}  // namespace

void RehearsalNotes::record(const Effect& effect) {
  if (!isOfInterest(effect)) return;
  auto noted = std::ranges::find(_settings, effect.setting, &RehearsedSetting::setting);
  if (noted == _settings.end()) {
    _settings.push_back({.setting = effect.setting, .unit = unitOf(effect.setting)});
    noted = std::prev(_settings.end());
    noted->now = effect.before ? effect.before : effect.outcome == Outcome::applied ? std::nullopt : effect.stored;
  }
  const auto verdict = verdictOf(effect);
  if (verdict > noted->verdict || noted->verdict == Verdict::unchanged)
    noted->reason = effect.failure ? describe(*effect.failure) : "";
  noted->verdict = std::max(noted->verdict, verdict);
  noted->then = effect.live ? effect.live : effect.stored;
  noted->stored = effect.stored;
  noted->undoneBy = effect.undoneBy;
  if (!effect.where.empty() && effect.outcome != Outcome::unchanged) noted->where = effect.where;
  addOnce(noted->notes, effect.note);
}

std::string RehearsalNotes::whereKept(std::string_view setting) const {
  const auto noted = std::ranges::find(_settings, setting, &RehearsedSetting::setting);
  return noted == _settings.end() ? "" : noted->where;
}

bool isOfStartupDisk(const std::string& word) {
  constexpr std::string_view words[] = {"-getstartupdisk", "-setstartupdisk", "-liststartupdisks"};
  return std::ranges::find(words, withDash(word)) != std::end(words);
}

std::vector<WordResult> rehearseWords(std::span<const std::string> words, WordRunner& runner) {
  const auto table = productTable();
  std::vector<WordResult> results;
  while (!words.empty()) {
    results.push_back(isOfStartupDisk(words.front()) ? unrehearsed(words, table) : runner.run(words));
    if (results.back().isLast) break;
    words = words.subspan(results.back().words.size());
  }
  return results;
}

RehearsedSetting rehearsed(const AppliedSetting& applied, const RehearsalNotes& notes) {
  return {.setting = std::string(applied.setting->name),
          .unit = applied.unit,
          .now = applied.before,
          .then = applied.after,
          .stored = applied.stored,
          .where = notes.whereKept(applied.setting->name),
          .verdict = applied.verdict,
          .reason = applied.reason,
          .undoneBy = applied.undoneBy,
          .notes = applied.notes};
}

bool isAllDone(const Rehearsed& rehearsed) {
  const auto isDone = [](Verdict verdict) { return verdict <= Verdict::applied; };
  return std::ranges::all_of(rehearsed.words, [&](const auto& word) { return isDone(verdictOf(word)); }) &&
         std::ranges::all_of(rehearsed.settings, isDone, &RehearsedSetting::verdict);
}

}  // namespace tavisk::control
