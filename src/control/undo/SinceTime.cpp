// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/undo/SinceTime.h"

#include <ctime>
#include <string_view>

#include "base/Calendar.h"
#include "base/Text.h"
#include "base/TimeSpan.h"

namespace tavisk::control {
namespace {

/// The first second of a day, which may be one of another month: the 0th is the day before the 1st.
std::int64_t midnight(DateTime day, std::int64_t daysLater = 0) {
  day.day += daysLater;
  day.hour = day.minute = day.second = 0;
  return static_cast<std::int64_t>(secondsSince1970(day));
}

std::optional<std::tm> matched(const std::string& text, const char* format, std::tm otherwise) {
  const auto* end = ::strptime(text.c_str(), format, &otherwise);
  if (!end || *end != '\0') return std::nullopt;
  return otherwise;
}

/// A day that its month does not have is none.
std::optional<std::int64_t> momentOf(const DateTime& local) {
  constexpr std::int64_t noLeapSecond = 59;
  auto day = local;
  day.hour = 12;
  const auto same = localDateTime(static_cast<std::int64_t>(secondsSince1970(day)));
  if (same.day != local.day || same.month != local.month || local.second > noLeapSecond) return std::nullopt;
  return static_cast<std::int64_t>(secondsSince1970(local));
}

std::optional<std::int64_t> written(const std::string& text, const DateTime& today) {
  std::tm start{};
  start.tm_year = static_cast<int>(today.year - 1900);
  start.tm_mon = static_cast<int>(today.month - 1);
  start.tm_mday = static_cast<int>(today.day);
  for (const char* format :
       {"%Y-%m-%d %H:%M:%S", "%Y-%m-%dT%H:%M:%S", "%Y-%m-%d %H:%M", "%Y-%m-%dT%H:%M", "%Y-%m-%d", "%H:%M:%S", "%H:%M"})
    if (const auto time = matched(text, format, start))
      return momentOf(
          {time->tm_year + 1900, time->tm_mon + 1, time->tm_mday, time->tm_hour, time->tm_min, time->tm_sec});
  return std::nullopt;
}

std::optional<std::int64_t> before(std::int64_t now, std::string_view span) {
  const auto length = timeSpan(span);
  if (!length || *length == endlessTime) return std::nullopt;
  return now - std::chrono::duration_cast<std::chrono::seconds>(*length).count();
}

}  // namespace

std::optional<std::int64_t> timeMeantBy(const std::string& text, std::int64_t now) {
  constexpr std::string_view ago = " ago";
  const std::string_view view = text;
  const auto today = localDateTime(now);
  if (text == "now") return now;
  if (text == "today") return midnight(today);
  if (text == "yesterday") return midnight(today, -1);
  if (view.starts_with('@')) return parseNumber<std::int64_t>(view.substr(1));
  if (view.starts_with('-')) return before(now, view.substr(1));
  if (view.ends_with(ago)) return before(now, trimmed(view.substr(0, view.size() - ago.size())));
  return written(text, today);
}

}  // namespace tavisk::control
