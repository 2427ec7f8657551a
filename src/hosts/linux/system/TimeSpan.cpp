// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/TimeSpan.h"

#include <charconv>
#include <limits>

namespace tavisk {
namespace {

struct Unit {
  std::string_view name;
  std::int64_t microseconds;
};

constexpr std::int64_t second = 1'000'000;
constexpr Unit units[] = {
    {"", second},
    {"s", second},
    {"sec", second},
    {"second", second},
    {"seconds", second},
    {"us", 1},
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
};

std::string_view takeSpaces(std::string_view text) {
  auto start = text.find_first_not_of(" \t");
  return start == std::string_view::npos ? std::string_view() : text.substr(start);
}

/// The number and its unit at the front, which are taken off.
std::optional<std::int64_t> takePart(std::string_view& text) {
  std::int64_t number = 0;
  auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || number < 0) return std::nullopt;
  text = takeSpaces(text.substr(static_cast<std::size_t>(end - text.data())));
  auto name = text.substr(0, text.find_first_of("0123456789 \t"));
  for (const auto& unit : units) {
    if (unit.name != name) continue;
    if (number > std::numeric_limits<std::int64_t>::max() / unit.microseconds) return std::nullopt;
    text = takeSpaces(text.substr(name.size()));
    return number * unit.microseconds;
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::chrono::microseconds> timeSpan(std::string_view text) {
  std::int64_t sum = 0;
  text = takeSpaces(text);
  if (text.empty()) return std::nullopt;
  while (!text.empty()) {
    auto part = takePart(text);
    if (!part || *part > std::numeric_limits<std::int64_t>::max() - sum) return std::nullopt;
    sum += *part;
  }
  return std::chrono::microseconds(sum);
}

}  // namespace tavisk
