// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <chrono>
#include <ostream>
#include <string>
#include <vector>

#include "effects/Effect.h"
#include "effects/SettingNames.h"
#include "platform/ClockService.h"

namespace tavisk {

inline void PrintTo(const ZoneName& zone, std::ostream* out) {
  *out << zone.text;
}

/// `Machine` offers: service(); haveZones(zones), those that are installed or known; effects(); and `setsClock`, false
/// where the clock is that of the machine that runs the tests.
template <typename Machine>
struct ClockContract : testing::Test {
  ClockContract() { machine.haveZones(zones); }

  const ZoneName cairo{"Africa/Cairo"};
  const ZoneName paris{"Europe/Paris"};
  const std::vector<ZoneName> zones{cairo, paris, utc()};
  Machine machine;
};

TYPED_TEST_SUITE_P(ClockContract);

TYPED_TEST_P(ClockContract, goesOnFromTheTimeThatWasSet) {
  if (!TypeParam::setsClock) return;
  for (std::int64_t time : {0LL, 1'166'999'400LL, 4'102'444'800LL}) {
    this->machine.service().setTime(time);
    EXPECT_GE(this->machine.service().now(), time);
    EXPECT_LE(this->machine.service().now(), time + 10);
  }
}

TYPED_TEST_P(ClockContract, tellsTheRealTimeAtFirst) {
  using std::chrono::system_clock;  // std::time may lag behind it
  const auto before = system_clock::to_time_t(system_clock::now());
  const auto told = this->machine.service().now();
  EXPECT_GE(told, before);
  EXPECT_LE(told, system_clock::to_time_t(system_clock::now()));
}

TYPED_TEST_P(ClockContract, knowsEachInstalledZoneOnce) {
  EXPECT_THAT(this->machine.service().knownTimeZones(), testing::UnorderedElementsAreArray(this->zones));
}

TYPED_TEST_P(ClockContract, isInUtcUntilAZoneIsSet) {
  auto& clock = this->machine.service();
  EXPECT_EQ(clock.timeZone(), utc());
  for (const auto& zone : {this->paris, this->cairo, this->cairo}) {
    const auto before = clock.timeZone();
    clock.setTimeZone(zone);
    EXPECT_EQ(clock.timeZone(), zone);
    auto told = this->machine.effects().back();
    told.where.clear();
    const auto outcome = zone == before ? Outcome::unchanged : Outcome::applied;
    Effect expected{setting::timeZone, outcome, before.text, zone.text, zone.text, zone.text};
    expected.changed = zone != before;
    EXPECT_EQ(told, expected);
  }
}

TYPED_TEST_P(ClockContract, takesRulesFromZoneFilesOnly) {
  EXPECT_THAT(this->machine.service().rulesOf({"Europe/Paris"}), testing::EndsWith("/usr/share/zoneinfo/Europe/Paris"));
  for (const char* name : {"", "/etc/passwd", "../../../etc/passwd", "Europe/../../../../etc/passwd"})
    EXPECT_THAT(this->machine.service().rulesOf({name}), testing::EndsWith("/usr/share/zoneinfo/UTC")) << name;
}

REGISTER_TYPED_TEST_SUITE_P(ClockContract, goesOnFromTheTimeThatWasSet, tellsTheRealTimeAtFirst,
                            knowsEachInstalledZoneOnce, isInUtcUntilAZoneIsSet, takesRulesFromZoneFilesOnly);

}  // namespace tavisk
