// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "platform/PowerSettingsService.h"

namespace tavisk {

/// `Machine` offers: service(), of a machine that supports every switch, all off and all timers never; and lack(which),
/// which takes the support of a switch away; effects() and values().
template <typename Machine>
struct PowerSettingsContract : testing::Test {
  static constexpr SleepTimer timers[] = {SleepTimer::computer, SleepTimer::display, SleepTimer::hardDisk};
  static constexpr PowerSwitch switches[] = {PowerSwitch::wakeOnModem, PowerSwitch::wakeOnNetworkAccess,
                                             PowerSwitch::restartAfterPowerFailure, PowerSwitch::powerButtonSleep};
  const PowerSource source{"AC Power"};
  Machine machine;
};

TYPED_TEST_SUITE_P(PowerSettingsContract);

TYPED_TEST_P(PowerSettingsContract, keepsEachTimerApart) {
  auto& power = this->machine.service();
  for (const auto timer : this->timers) EXPECT_EQ(power.untilSleep(timer, this->source).count, 0U);
  unsigned long minutes = 1;
  for (const auto timer : this->timers) power.setUntilSleep(timer, this->source, {minutes++});
  minutes = 1;
  for (const auto timer : this->timers) EXPECT_EQ(power.untilSleep(timer, this->source).count, minutes++);
  power.setUntilSleep(SleepTimer::computer, this->source, {0});
  EXPECT_EQ(power.untilSleep(SleepTimer::computer, this->source).count, 0U);
}

TYPED_TEST_P(PowerSettingsContract, keepsEachSwitchApart) {
  auto& power = this->machine.service();
  for (const auto turned : this->switches) {
    power.setOn(turned, this->source, true);
    for (const auto which : this->switches) EXPECT_EQ(power.isOn(which, this->source), which == turned);
    power.setOn(turned, this->source, false);
    EXPECT_FALSE(power.isOn(turned, this->source));
  }
  for (bool restarts : {true, false}) {
    power.setRestartsAfterFreeze(restarts);
    EXPECT_EQ(power.restartsAfterFreeze(), restarts);
  }
}

TYPED_TEST_P(PowerSettingsContract, saysWhatTheMachineLacks) {
  for (const auto lacking : this->switches) {
    EXPECT_TRUE(this->machine.service().supports(lacking, this->source));
    this->machine.lack(lacking);
    EXPECT_FALSE(this->machine.service().supports(lacking, this->source));
    ASSERT_FALSE(this->machine.values().empty());
    EXPECT_EQ(this->machine.values().back().setting, nameOf(lacking));
    EXPECT_TRUE(this->machine.values().back().unsupported);
    EXPECT_TRUE(this->machine.effects().empty());
    EXPECT_FALSE(this->machine.service().isOn(lacking, this->source));
  }
}

REGISTER_TYPED_TEST_SUITE_P(PowerSettingsContract, keepsEachTimerApart, keepsEachSwitchApart, saysWhatTheMachineLacks);

}  // namespace tavisk
