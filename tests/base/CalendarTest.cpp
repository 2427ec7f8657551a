// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <limits>
#include <random>

#include "base/Calendar.h"

namespace tavisk {

void PrintTo(const DateTime& time, std::ostream* out) {
  *out << time.year << '-' << time.month << '-' << time.day << ' ' << time.hour << ':' << time.minute << ':'
       << time.second;
}

namespace {

struct CalendarTest : ::testing::Test {
  static void useZone(const std::string& name) { setDefaultTimeZone("/usr/share/zoneinfo/" + name); }
  ~CalendarTest() override { useZone("UTC"); }
};

TEST_F(CalendarTest, goesBothWays) {
  const std::tuple<const char*, std::int64_t, DateTime> cases[] = {
      {"UTC", 0, {1970, 1, 1, 0, 0, 0}},
      {"UTC", -1, {1969, 12, 31, 23, 59, 59}},
      {"UTC", -62135596800, {1, 1, 1, 0, 0, 0}},
      {"UTC", 253402300799, {9999, 12, 31, 23, 59, 59}},
      {"UTC", 2147483648, {2038, 1, 19, 3, 14, 8}},
      {"UTC", 4107542400, {2100, 3, 1, 0, 0, 0}},
      {"America/New_York", 0, {1969, 12, 31, 19, 0, 0}},
      {"America/New_York", 1720000000, {2024, 7, 3, 5, 46, 40}},
      {"Europe/Paris", 1700000000, {2023, 11, 14, 23, 13, 20}},
      {"Europe/Paris", 4118983200, {2100, 7, 11, 12, 0, 0}},
      {"Asia/Kolkata", 1700000000, {2023, 11, 15, 3, 43, 20}},
      // Local mean time, before there were zones: 4 h 56 min 2 s behind.
      {"America/New_York", -62135579038, {1, 1, 1, 0, 0, 0}},
  };
  for (const auto& [zone, seconds, local] : cases) {
    useZone(zone);
    EXPECT_EQ(localDateTime(seconds), local) << zone;
    EXPECT_EQ(secondsSince1970(local), static_cast<double>(seconds)) << zone;
  }
}

TEST_F(CalendarTest, carriesWhatIsOutOfRange) {
  useZone("UTC");
  const std::pair<DateTime, DateTime> cases[] = {
      {{2023, 12, 31, 24, 0, 0}, {2024, 1, 1, 0, 0, 0}},   {{2023, 2, 31, 12, 0, 0}, {2023, 3, 3, 12, 0, 0}},
      {{2024, 2, 31, 12, 0, 0}, {2024, 3, 2, 12, 0, 0}},   {{2024, 13, 1, 0, 0, 0}, {2025, 1, 1, 0, 0, 0}},
      {{2024, 0, 0, 0, 0, 0}, {2023, 11, 30, 0, 0, 0}},    {{2024, -11, 1, 0, 0, -1}, {2022, 12, 31, 23, 59, 59}},
      {{1970, 1, 1, 0, 0, 90'061}, {1970, 1, 2, 1, 1, 1}}, {{0, 1, 0, 0, -1, 0}, {-1, 12, 30, 23, 59, 0}},
  };
  for (const auto& [given, expected] : cases) {
    EXPECT_EQ(localDateTime(static_cast<std::int64_t>(secondsSince1970(given))), expected)
        << ::testing::PrintToString(given);
  }
}

TEST_F(CalendarTest, decidesAtChangesOfTheOffset) {
  const std::tuple<const char*, const char*, DateTime, std::int64_t> cases[] = {
      {"in the gap", "America/New_York", {2024, 3, 10, 2, 30, 0}, 1710055800},  // 3:30
      {"first after the gap", "America/New_York", {2024, 3, 10, 3, 0, 0}, 1710054000},
      {"twice", "America/New_York", {2024, 11, 3, 1, 30, 0}, 1730611800},  // summer time
      {"in the gap", "Europe/Paris", {2024, 3, 31, 2, 0, 0}, 1711846800},  // 3:00
      {"twice", "Europe/Paris", {2024, 10, 27, 2, 0, 0}, 1729987200},
      {"24:00 of the day before", "Europe/Paris", {2024, 3, 30, 24, 0, 0}, 1711839600},
      {"a day left out", "Pacific/Apia", {2011, 12, 30, 12, 0, 0}, 1325282400},  // the 31st
  };
  for (const auto& [what, zone, local, seconds] : cases) {
    useZone(zone);
    EXPECT_EQ(secondsSince1970(local), static_cast<double>(seconds)) << zone << ' ' << what;
  }
}

TEST_F(CalendarTest, returnsToEveryTimeThatHappensOnce) {
  std::mt19937_64 random(3);
  for (const char* zone : {"America/New_York", "Europe/Paris", "Australia/Lord_Howe", "Africa/Monrovia"}) {
    useZone(zone);
    for (int round = 0; round < 5000; ++round) {
      const std::int64_t seconds = static_cast<std::int64_t>(random() % 315'537'897'600) - 62'135'596'800;
      const auto local = localDateTime(seconds);
      const auto back = static_cast<std::int64_t>(secondsSince1970(local));
      ASSERT_EQ(localDateTime(back), local) << zone << ' ' << seconds;
      ASSERT_LE(back, seconds) << zone << ": the first of two";
      ASSERT_LE(seconds - back, 7200) << zone;
    }
  }
}

TEST_F(CalendarTest, takesUtcForAZoneThatCannotBeRead) {
  for (const char* file : {"/nowhere/Europe/Paris", "/etc/passwd", "/usr/share/zoneinfo", ""}) {
    useZone("Europe/Paris");
    setDefaultTimeZone(file);
    EXPECT_EQ(localDateTime(1720000000), (DateTime{2024, 7, 3, 9, 46, 40})) << file;
  }
}

TEST_F(CalendarTest, survivesAbsurdNumbers) {
  constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
  constexpr std::int64_t least = std::numeric_limits<std::int64_t>::min();
  for (const char* zone : {"UTC", "Europe/Paris"}) {
    useZone(zone);
    EXPECT_GT(secondsSince1970({most, most, most, most, most, most}), 3e17);
    EXPECT_LT(secondsSince1970({least, least, least, least, least, least}), -3e17);
    EXPECT_GT(localDateTime(most).year, 10'000'000'000);
    EXPECT_LT(localDateTime(least).year, -10'000'000'000);
  }
}

}  // namespace
}  // namespace tavisk
