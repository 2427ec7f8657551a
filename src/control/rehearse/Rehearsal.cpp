// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/rehearse/Rehearsal.h"

#include <algorithm>
#include <utility>

#include "control/ManagedSettings.h"

namespace tavisk::control {
namespace {

std::string unitOfSetting(const std::string& name) {
  const auto* setting = managedNamed(name);
  if (!setting) return {};
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

void addOnce(std::vector<std::string>& texts, const std::string& text) {
  if (!text.empty() && std::ranges::find(texts, text) == texts.end()) texts.push_back(text);
}

/// What is done without any value, as when a daemon is told to read its files again, is no setting of the machine.
bool isOfInterest(const Effect& effect) {
  return effect.asked && (effect.failure || effect.before || effect.live || effect.stored);
}

}  // namespace

void RehearsalNotes::record(const Effect& effect) {
  if (!isOfInterest(effect)) return;
  auto noted = std::ranges::find(_settings, effect.setting, &RehearsedSetting::setting);
  if (noted == _settings.end()) {
    _settings.push_back({.setting = effect.setting, .unit = unitOfSetting(effect.setting)});
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

Rehearsed rehearseWords(std::span<const std::string> words, WordRunner& runner) {
  Rehearsed rehearsed;
  while (!words.empty() && (rehearsed.words.empty() || !rehearsed.words.back().isLast)) {
    rehearsed.words.push_back(runner.run(words));
    words = words.subspan(rehearsed.words.back().words.size());
  }
  rehearsed.dropped.assign(words.begin(), words.end());
  return rehearsed;
}

RehearsedSetting rehearsed(const AppliedSetting& applied, const RehearsalNotes& notes) {
  return {.setting = std::string(applied.setting->name),
          .unit = applied.unit,
          .now = applied.before,
          .storedNow = applied.storedBefore,
          .then = applied.after,
          .stored = applied.stored,
          .where = notes.whereKept(applied.setting->name),
          .verdict = applied.verdict,
          .reason = applied.reason,
          .undoneBy = applied.undoneBy,
          .notes = applied.notes,
          .isChanged = applied.isChanged,
          .lasts = applied.lasts};
}

bool isAllDone(const Rehearsed& rehearsed, const Invocation& invocation) {
  const auto isWordDone = [&](const WordResult& word) { return isDone(verdictOf(word), true, invocation); };
  const auto isSettingDone = [&](const RehearsedSetting& setting) {
    return isDone(setting.verdict, setting.lasts.value_or(true), invocation);
  };
  return rehearsed.dropped.empty() && std::ranges::all_of(rehearsed.words, isWordDone) &&
         std::ranges::all_of(rehearsed.settings, isSettingDone);
}

}  // namespace tavisk::control
