// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/StatusText.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>

#include "base/Calendar.h"
#include "base/Json.h"
#include "base/Text.h"

namespace tavisk::control {
namespace {

constexpr std::string_view nothing = "-";
constexpr std::size_t columns = 4;
using Cells = std::array<std::string, columns>;

/// Of a table: cells, or a text across all but the first of them; and what stands below.
struct Line {
  Cells cells;
  std::string across;
  std::vector<std::string> below;
};

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

std::string shown(const std::optional<std::string>& value, const std::string& unit) {
  return value && !value->empty() ? escaped(shownValue(*value, unit)) : std::string(nothing);
}

Line lineOf(const SettingState& state) {
  const auto& value = state.value;
  Line line;
  line.cells[0] = escaped(value.setting);
  const bool isKnown = value.live || value.stored;
  if (value.unsupported) {
    line.across = "not supported: " + describe(*value.unsupported);
  } else if (!isKnown && !state.failures.empty()) {
    line.across = "not known";
  } else {
    line.cells[1] = shown(value.live, value.unit);
    line.cells[2] = shown(value.stored, value.unit);
    line.cells[3] = value.where.empty() ? nothing : escaped(value.where);
  }
  for (const auto& [name, fact] : value.facts) line.below.push_back(escaped(name) + ": " + escaped(fact));
  if (!value.undoneBy.empty()) line.below.push_back("may be undone by " + escaped(value.undoneBy));
  for (const auto& failure : state.failures) line.below.push_back("failed: " + describe(failure));
  return line;
}

std::size_t widthOf(std::string_view text) {
  return static_cast<std::size_t>(std::ranges::count_if(text, [](char c) { return !isContinuation(c); }));
}

std::array<std::size_t, columns> widthsOf(std::span<const Line> lines) {
  std::array<std::size_t, columns> widths{};
  for (const auto& line : lines)
    for (std::size_t i = 0; i < columns; ++i) widths[i] = std::max(widths[i], widthOf(line.cells[i]));
  return widths;
}

void pad(std::string& text, const std::string& cell, std::size_t width) {
  constexpr std::size_t gap = 2;
  text.append(cell).append(width - widthOf(cell) + gap, ' ');
}

void append(std::string& text, const Line& line, const std::array<std::size_t, columns>& widths) {
  if (line.across.empty()) {
    for (std::size_t i = 0; i + 1 < columns; ++i) pad(text, line.cells[i], widths[i]);
    text += line.cells.back();
  } else {
    pad(text, line.cells.front(), widths.front());
    text += line.across;
  }
  text += '\n';
  for (const auto& remark : line.below) text.append("  ").append(remark).append("\n");
}

void addIfAny(JsonObject& object, std::string_view name, const std::string& value) {
  if (!value.empty()) object.text(name, value);
}

std::string toJson(const Failure& failure) {
  JsonObject object;
  addIfAny(object, "tried", failure.tried);
  addIfAny(object, "on", failure.on);
  addIfAny(object, "why", failure.why);
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
  addIfAny(object, "unit", value.unit);
  addIfAny(object, "where", value.where);
  addIfAny(object, "undoneBy", value.undoneBy);
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

std::string statusTable(std::span<const SettingState> states) {
  std::vector<Line> lines{{.cells = {"Setting", "Now", "After a restart", "Kept in"}, .across = {}, .below = {}}};
  std::ranges::transform(states, std::back_inserter(lines), lineOf);
  const auto widths = widthsOf(lines);
  std::string text;
  for (const auto& line : lines) append(text, line, widths);
  return text;
}

std::string statusJson(std::span<const SettingState> states) {
  JsonObject settings;
  for (const auto& state : states) settings.json(state.value.setting, toJson(state));
  JsonObject object;
  return object.integer("status", 1).json("settings", settings.str()).str();
}

}  // namespace tavisk::control
