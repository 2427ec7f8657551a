// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <iterator>

#include "base/Json.h"
#include "base/Text.h"
#include "control/TextTable.h"
#include "control/rehearse/Rehearsal.h"
#include "control/status/StatusText.h"

namespace tavisk::control {
namespace {

std::string joined(std::span<const std::string> texts, const char* between) {
  std::string all;
  for (const auto& text : texts) all.append(all.empty() ? "" : between).append(text);
  return all;
}

std::string verdictText(Verdict verdict, const std::string& reason) {
  const std::string name = nameOf(verdict);
  return reason.empty() ? name : name + ": " + reason;
}

void addSetting(TextTable& table, const RehearsedSetting& setting) {
  const auto name = escaped(setting.setting);
  if (setting.verdict == Verdict::notSupported)
    return table.addRow({name, verdictText(setting.verdict, setting.reason)});
  table.addRow({name, shownAny(setting.now, setting.unit), shownAny(setting.then, setting.unit),
                setting.where.empty() ? "-" : escaped(setting.where)});
  if (setting.verdict != Verdict::applied) table.addRemark(verdictText(setting.verdict, setting.reason));
  if (setting.stored && setting.stored != setting.then)
    table.addRemark("after a restart: " + shownAny(setting.stored, setting.unit));
  if (!setting.undoneBy.empty()) table.addRemark("may be undone by " + escaped(setting.undoneBy));
  for (const auto& note : setting.notes) table.addRemark(escaped(note));
}

/// What a setting's row does not say.
bool isToldApart(const WordResult& word) {
  const auto verdict = verdictOf(word);
  if (verdict <= Verdict::applied) return false;
  return std::ranges::none_of(word.effects, [&](const Effect& effect) {
    return effect.asked && effect.failure && verdictOf(effect) == verdict;
  });
}

std::string partJson(const RehearsedSetting& setting) {
  JsonObject object;
  object.text("setting", setting.setting);
  object.textIfKnown("now", setting.now);
  object.textIfKnown("storedNow", setting.storedNow);
  object.textIfKnown("then", setting.then);
  object.textIfKnown("stored", setting.stored);
  object.textUnlessEmpty("unit", setting.unit);
  object.textUnlessEmpty("where", setting.where);
  object.text("outcome", nameOf(setting.verdict));
  object.textUnlessEmpty("reason", setting.reason);
  if (setting.isChanged) object.boolean("changed", *setting.isChanged);
  if (setting.lasts) object.boolean("lasts", *setting.lasts);
  object.textUnlessEmpty("undoneBy", setting.undoneBy);
  object.textUnlessEmpty("note", joined(setting.notes, "; "));
  return object.str();
}

std::string partJson(const WordResult& word);

std::string partJson(const Effect& effect) {
  return toJson(effect);
}

template <typename Parts>
std::vector<std::string> jsonOfEach(const Parts& parts) {
  std::vector<std::string> all;
  std::ranges::transform(parts, std::back_inserter(all), [](const auto& part) { return partJson(part); });
  return all;
}

std::string partJson(const WordResult& word) {
  JsonObject object;
  object.text("command", word.words.front());
  if (word.words.size() > 1) object.text("argument", joined(std::span(word.words).subspan(1), " "));
  const auto reason = reasonOf(word);
  object.text("outcome", nameOf(verdictOf(word)));
  object.textUnlessEmpty("reason", reason);
  object.boolean("failed", word.isFlagUp).array("effects", {jsonOfEach(word.effects)});
  return object.text("output", word.printed).str();
}

}  // namespace

std::string rehearsedTable(const Rehearsed& rehearsed) {
  TextTable table;
  table.addRow({"Setting", "Now", "Then", "Kept in"});
  for (const auto& setting : rehearsed.settings) addSetting(table, setting);
  for (const auto& word : rehearsed.words)
    if (isToldApart(word))
      table.addRow({escaped(joined(word.words, " ")), escaped(verdictText(verdictOf(word), reasonOf(word)))});
  if (!rehearsed.dropped.empty()) table.addRemark("not run: " + escaped(joined(rehearsed.dropped, " ")));
  return table.str();
}

std::string rehearsedJson(const Rehearsed& rehearsed, bool isDone, const std::string& folder) {
  JsonObject object;
  object.integer("rehearse", 1).boolean("done", isDone);
  object.textUnlessEmpty("folder", folder);
  if (!rehearsed.words.empty()) object.array("commands", {jsonOfEach(rehearsed.words)});
  object.textUnlessEmpty("dropped", joined(rehearsed.dropped, " "));
  return object.array("settings", {jsonOfEach(rehearsed.settings)}).str();
}

}  // namespace tavisk::control
