// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/TimeSpan.h"

#include <algorithm>
#include <charconv>
#include <limits>

namespace tavisk {
namespace {

struct Unit {
  std::string_view name;
  std::int64_t microseconds;
};

constexpr std::int64_t longest = std::numeric_limits<std::int64_t>::max();
constexpr std::int64_t second = 1'000'000;
constexpr Unit units[] = {
    {"", second},
    {"s", second},
    {"sec", second},
    {"second", second},
    {"seconds", second},
    {"us", 1},
    {"\u00b5s", 1},
    {"\u03bcs", 1},
    {"usec", 1},
    {"ms", 1000},
    {"msec", 1000},
    {"m", 60 * second},
    {"min", 60 * second},
    {"minute", 60 * second},
    {"minutes", 60 * second},
    {"h", 3600 * second},
    {"hr", 3600 * second},
    {"hour", 3600 * second},
    {"hours", 3600 * second},
    {"d", 86400 * second},
    {"day", 86400 * second},
    {"days", 86400 * second},
    {"w", 604800 * second},
    {"week", 604800 * second},
    {"weeks", 604800 * second},
    {"M", 2629800 * second},
    {"month", 2629800 * second},
    {"months", 2629800 * second},
    {"y", 31557600 * second},
    {"year", 31557600 * second},
    {"years", 31557600 * second},
};

std::string_view withoutSpacesBefore(std::string_view text) {
  return text.substr(std::min(text.find_first_not_of(" \t"), text.size()));
}

/// The digits behind a decimal point, which are taken off with it.
std::string_view takeDecimals(std::string_view& text) {
  if (!text.starts_with('.')) return "";
  const auto end = std::min(text.find_first_not_of("0123456789", 1), text.size());
  const auto digits = text.substr(1, end - 1);
  text.remove_prefix(end);
  return digits;
}

std::int64_t fractionOf(std::int64_t unit, std::string_view decimals) {
  std::int64_t sum = 0;
  for (const char digit : decimals) {
    unit /= 10;
    sum += (digit - '0') * unit;
  }
  return sum;
}

/// The number and its unit at the front, which are taken off.
std::optional<std::int64_t> takePart(std::string_view& text) {
  std::int64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || number < 0) return std::nullopt;
  text.remove_prefix(static_cast<std::size_t>(end - text.data()));
  const auto decimals = takeDecimals(text);
  text = withoutSpacesBefore(text);
  const auto name = text.substr(0, text.find_first_of("0123456789 \t"));
  const auto* unit = std::ranges::find(units, name, &Unit::name);
  if (unit == std::end(units) || number >= longest / unit->microseconds) return std::nullopt;
  text = withoutSpacesBefore(text.substr(name.size()));
  return number * unit->microseconds + fractionOf(unit->microseconds, decimals);
}

}  // namespace

std::optional<std::chrono::microseconds> timeSpan(std::string_view text) {
  std::int64_t sum = 0;
  text = withoutSpacesBefore(text);
  if (text.empty()) return std::nullopt;
  if (text == "infinity") return endlessTime;
  while (!text.empty()) {
    const auto part = takePart(text);
    if (!part || *part > longest - sum) return std::nullopt;
    sum += *part;
  }
  return std::chrono::microseconds(sum);
}

}  // namespace tavisk
