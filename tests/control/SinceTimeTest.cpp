// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <utility>

#include "base/Calendar.h"
#include "control/undo/SinceTime.h"

namespace tavisk::control {
namespace {

TEST(SinceTime, isReadInEachOfItsForms) {
  constexpr std::int64_t now = 1'772'368'200;  // 2026-03-01 13:30 in Paris
  constexpr std::int64_t hour = 3600;
  constexpr std::int64_t midnight = 1'772'319'600;
  setDefaultTimeZone("/usr/share/zoneinfo/Europe/Paris");
  const std::pair<const char*, std::optional<std::int64_t>> cases[] = {
      {"now", now},
      {"today", midnight},
      {"yesterday", midnight - 24 * hour},
      {"2026-03-01", midnight},
      {"2026-03-01 01:02", midnight + hour + 120},
      {"2026-03-01T01:02:03", midnight + hour + 123},
      {"2025-07-01 00:00:00", 1'751'320'800},
      {"01:00", midnight + hour},
      {"01:00:07", midnight + hour + 7},
      {"-2h", now - 2 * hour},
      {"-1h 30min", now - hour - 1800},
      {"2 hours ago", now - 2 * hour},
      {"1day ago", now - 24 * hour},
      {"@0", 0},
      {"@-60", -60},
      {"", std::nullopt},
      {"2026-02-29", std::nullopt},
      {"2026-02-28 24:00", std::nullopt},
      {"2026-02-28 23:59:60", std::nullopt},
      {"2026-03-01 1:00 x", std::nullopt},
      {"-infinity", std::nullopt},
      {"ago", std::nullopt},
      {"@1x", std::nullopt},
      {"--last", std::nullopt},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(timeMeantBy(text, now), expected) << text;
}

}  // namespace
}  // namespace tavisk::control
