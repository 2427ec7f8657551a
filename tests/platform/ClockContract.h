// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <set>
#include <string>

#include "platform/ClockService.h"

namespace tavisk {

/// `Machine` offers: service(); haveZones(names), the zones that are installed or known; effects(), a line of JSON for
/// each; and `setsClock`, false where the clock is that of the machine that runs the tests.
template <typename Machine>
class ClockContract : public testing::Test {
 protected:
  void SetUp() override { machine.haveZones({"Africa/Cairo", "Europe/Paris", "UTC"}); }
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
  auto before = system_clock::to_time_t(system_clock::now());
  auto told = this->machine.service().now();
  EXPECT_GE(told, before);
  EXPECT_LE(told, system_clock::to_time_t(system_clock::now()));
}

TYPED_TEST_P(ClockContract, knowsEachInstalledZoneOnce) {
  EXPECT_THAT(this->machine.service().knownTimeZones(),
              testing::UnorderedElementsAre("Africa/Cairo", "Europe/Paris", "UTC"));
}

TYPED_TEST_P(ClockContract, isInUtcUntilAZoneIsSet) {
  auto& clock = this->machine.service();
  EXPECT_EQ(clock.timeZone(), "UTC");
  for (const char* zone : {"Europe/Paris", "Africa/Cairo", "Africa/Cairo"}) {
    clock.setTimeZone(std::string("/usr/share/zoneinfo/") + zone);
    EXPECT_EQ(clock.timeZone(), zone);
  }
  using testing::AllOf, testing::HasSubstr;
  auto effects = this->machine.effects();
  ASSERT_EQ(effects.size(), 3U);
  EXPECT_THAT(effects[0], AllOf(HasSubstr(R"("before":"UTC","asked":"Europe/Paris","live":"Europe/Paris")"),
                                HasSubstr(R"("outcome":"applied")")));
  EXPECT_THAT(effects[2], HasSubstr(R"("outcome":"unchanged")"));
}

TYPED_TEST_P(ClockContract, takesRulesFromZoneFilesOnly) {
  EXPECT_THAT(this->machine.service().rulesOf("Europe/Paris"), testing::EndsWith("/usr/share/zoneinfo/Europe/Paris"));
  for (const char* name : {"", "/etc/passwd", "../../../etc/passwd", "Europe/../../../../etc/passwd"})
    EXPECT_THAT(this->machine.service().rulesOf(name), testing::EndsWith("/usr/share/zoneinfo/UTC")) << name;
}

REGISTER_TYPED_TEST_SUITE_P(ClockContract, goesOnFromTheTimeThatWasSet, tellsTheRealTimeAtFirst,
                            knowsEachInstalledZoneOnce, isInUtcUntilAZoneIsSet, takesRulesFromZoneFilesOnly);

}  // namespace tavisk
