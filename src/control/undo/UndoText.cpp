// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/undo/UndoText.h"

#include <algorithm>
#include <iterator>
#include <string_view>
#include <utility>

#include "base/Json.h"
#include "base/Text.h"
#include "control/TextTable.h"
#include "control/apply/ApplyText.h"
#include "control/status/StatusText.h"

namespace tavisk::control {
namespace {

/// What has not come to be, and why.
std::string remarkOn(const PlannedUndo& planned, bool isRun) {
  if (planned.step == UndoStep::reset) return isRun ? "" : "reset: what tavisk keeps of it is taken away";
  if (isRun || planned.step == UndoStep::set) return escaped(planned.why);
  return nameOf(planned.step) + (planned.why.empty() ? "" : ": " + escaped(planned.why));
}

/// What has come to nothing is as it was.
void addRemarks(TextTable& table, const AppliedSetting& applied) {
  if (!applied.reason.empty()) table.addRemark(applied.reason);
  if (applied.verdict <= Verdict::applied && !applied.lasts) addWhatUndoes(table, applied);
}

void addRow(TextTable& table, const UndoResult& result, bool isRun) {
  const auto& [planned, outcome] = result;
  std::vector<std::string> cells{escaped(planned.setting), shownAny(planned.now, planned.unit),
                                 shownAny(planned.back, planned.unit)};
  if (isRun) cells.emplace_back(outcome ? nameOf(outcome->verdict) : nameOf(planned.step));
  table.addRow(std::move(cells));
  if (auto remark = remarkOn(planned, isRun); !remark.empty()) table.addRemark(std::move(remark));
  if (outcome) addRemarks(table, *outcome);
}

std::string resultObject(const UndoResult& result) {
  const auto& [planned, outcome] = result;
  JsonObject object;
  object.textIfKnown("now", planned.now).textIfKnown("back", planned.back).textUnlessEmpty("unit", planned.unit);
  object.text("step", nameOf(planned.step)).textUnlessEmpty("why", planned.why);
  if (outcome) {
    object.text("outcome", nameOf(outcome->verdict)).textUnlessEmpty("reason", outcome->reason);
    object.boolean("lasts", outcome->lasts).textUnlessEmpty("undoneBy", outcome->undoneBy);
  }
  return object.str();
}

std::string remarkObject(const std::string& remark) {
  return JsonObject().text("text", remark).str();
}

std::vector<std::string> remarkObjects(const std::vector<std::string>& remarks) {
  std::vector<std::string> objects;
  std::ranges::transform(remarks, std::back_inserter(objects), remarkObject);
  return objects;
}

}  // namespace

std::string undoTable(std::span<const UndoResult> results, bool isRun) {
  if (results.empty()) return "Nothing to take back.\n";
  TextTable table;
  std::vector<std::string> headings{"Setting", isRun ? "Was" : "Now", "Back to"};
  if (isRun) headings.emplace_back("Outcome");
  table.addRow(std::move(headings));
  for (const auto& result : results) addRow(table, result, isRun);
  return table.str();
}

std::string undoJson(std::span<const UndoResult> results, const std::vector<std::string>& remarks) {
  JsonObject settings;
  for (const auto& result : results) settings.json(result.planned.setting, resultObject(result));
  JsonObject object;
  object.integer("undo", 1).json("settings", settings.str());
  if (!remarks.empty()) object.array("remarks", {remarkObjects(remarks)});
  return object.str();
}

}  // namespace tavisk::control
