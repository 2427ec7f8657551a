// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/apply/ApplyText.h"

#include <algorithm>
#include <iterator>

#include "base/Json.h"
#include "base/Text.h"
#include "control/TextTable.h"
#include "control/status/StatusText.h"

namespace tavisk::control {
namespace {

std::string outcomeOf(const AppliedSetting& applied) {
  const std::string name = nameOf(applied.verdict);
  return applied.reason.empty() ? name : name + ": " + applied.reason;
}

void addApplied(TextTable& table, const AppliedSetting& applied) {
  table.addRow({escaped(applied.setting->name), shownAny(applied.before, applied.unit),
                shownAny(applied.after, applied.unit), outcomeOf(applied)});
  for (const auto& note : applied.notes) table.addRemark(escaped(note));
  if (!applied.lasts && applied.verdict != Verdict::notSupported) addWhatUndoes(table, applied);
}

std::string jsonOf(const AppliedSetting& applied) {
  JsonObject object;
  object.text("setting", applied.setting->name);
  object.textIfKnown("wanted", applied.wanted);
  object.textIfKnown("before", applied.before);
  object.textIfKnown("storedBefore", applied.storedBefore);
  object.textIfKnown("after", applied.after);
  object.textIfKnown("stored", applied.stored);
  object.textUnlessEmpty("unit", applied.unit);
  object.text("outcome", nameOf(applied.verdict));
  object.textUnlessEmpty("reason", applied.reason);
  object.boolean("changed", applied.isChanged).boolean("lasts", applied.lasts);
  object.textUnlessEmpty("undoneBy", applied.undoneBy);
  std::string notes;
  for (const auto& note : applied.notes) notes.append(notes.empty() ? "" : "; ").append(note);
  object.textUnlessEmpty("note", notes);
  return object.str();
}

}  // namespace

void addWhatUndoes(TextTable& table, const AppliedSetting& applied) {
  if (applied.undoneBy.empty())
    table.addRemark("after a restart: " + shownAny(applied.stored, applied.unit));
  else
    table.addRemark("may be undone by " + escaped(applied.undoneBy));
}

std::string appliedTable(std::span<const AppliedSetting> settings) {
  TextTable table;
  table.addRow({"Setting", "Was", "Is", "Outcome"});
  for (const auto& applied : settings) addApplied(table, applied);
  return table.str();
}

std::string appliedJson(std::string_view command, std::span<const AppliedSetting> settings, bool isDone) {
  std::vector<std::string> outcomes;
  std::ranges::transform(settings, std::back_inserter(outcomes), jsonOf);
  JsonObject object;
  object.integer(command, 1).boolean("done", isDone);
  object.boolean("changed", std::ranges::any_of(settings, &AppliedSetting::isChanged));
  return object.array("settings", {outcomes}).str();
}

}  // namespace tavisk::control
