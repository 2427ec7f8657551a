// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/status/StatusText.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <string_view>

#include "base/Calendar.h"
#include "base/Json.h"
#include "base/Text.h"
#include "control/TextTable.h"

namespace tavisk::control {
namespace {

constexpr const char* nothing = "-";

std::string shownTime(std::int64_t secondsSince1970) {
  const auto local = localDateTime(secondsSince1970);
  std::array<char, 64> text{};
  static_cast<void>(std::snprintf(text.data(), text.size(), "%04ld-%02ld-%02ld %02ld:%02ld:%02ld", local.year,
                                  local.month, local.day, local.hour, local.minute, local.second));
  return text.data();
}

/// A controller may answer any 64-bit number: the product wraps.
std::string shownUnits(std::int64_t units) {
  constexpr std::uint64_t secondsInUnit = 30;
  return std::to_string(static_cast<std::int64_t>(static_cast<std::uint64_t>(units) * secondsInUnit)) + " seconds";
}

void add(TextTable& table, const SettingState& state) {
  const auto& value = state.value;
  const bool isKnown = value.live || value.stored;
  if (value.unsupported) {
    table.addRow({escaped(value.setting), "not supported: " + describe(*value.unsupported)});
  } else if (!isKnown && !state.failures.empty()) {
    table.addRow({escaped(value.setting), "not known"});
  } else {
    table.addRow({escaped(value.setting), shownAny(value.live, value.unit), shownAny(value.stored, value.unit),
                  value.where.empty() ? nothing : escaped(value.where)});
  }
  for (const auto& [name, fact] : value.facts) table.addRemark(escaped(name) + ": " + escaped(fact));
  if (!value.undoneBy.empty()) table.addRemark("may be undone by " + escaped(value.undoneBy));
  for (const auto& failure : state.failures) table.addRemark("failed: " + describe(failure));
}

std::string toJson(const Failure& failure) {
  JsonObject object;
  object.textUnlessEmpty("tried", failure.tried);
  object.textUnlessEmpty("on", failure.on);
  object.textUnlessEmpty("why", failure.why);
  return object.str();
}

std::string toJson(const Facts& facts) {
  JsonObject object;
  for (const auto& [name, fact] : facts) object.text(name, fact);
  return object.str();
}

std::string toJson(const SettingState& state) {
  const auto& value = state.value;
  JsonObject object;
  object.boolean("supported", !value.unsupported);
  if (value.live) object.text("live", *value.live);
  if (value.stored) object.text("stored", *value.stored);
  object.textUnlessEmpty("unit", value.unit);
  object.textUnlessEmpty("where", value.where);
  object.textUnlessEmpty("undoneBy", value.undoneBy);
  if (!value.facts.empty()) object.json("facts", toJson(value.facts));
  if (value.unsupported) object.json("unsupported", toJson(*value.unsupported));
  std::vector<std::string> failures;
  for (const auto& failure : state.failures) failures.push_back(toJson(failure));
  if (!failures.empty()) object.array("failures", {failures});
  return object.str();
}

}  // namespace

std::string shownValue(const std::string& value, const std::string& unit) {
  const auto number = parseNumber<std::int64_t>(value);
  if (unit.empty()) return value;
  if (!number) return value + " (" + unit + ")";
  if (unit == "seconds since 1970") return shownTime(*number);
  if (unit == "units of 30 seconds") return shownUnits(*number);
  if (unit == "minutes" && *number == 0) return "never";
  return value + " " + (*number == 1 && unit == "minutes" ? "minute" : unit);
}

std::string shownAny(const std::optional<std::string>& value, const std::string& unit) {
  return value && !value->empty() ? escaped(shownValue(*value, unit)) : nothing;
}

std::string statusTable(std::span<const SettingState> states) {
  TextTable table;
  table.addRow({"Setting", "Now", "After a restart", "Kept in"});
  for (const auto& state : states) add(table, state);
  return table.str();
}

std::string statusJson(std::span<const SettingState> states) {
  JsonObject settings;
  for (const auto& state : states) settings.json(state.value.setting, toJson(state));
  JsonObject object;
  return object.integer("status", 1).json("settings", settings.str()).str();
}

}  // namespace tavisk::control
