// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include "platform/NetworkTimeService.h"

namespace tavisk {

/// `Machine` offers: service(); launchesAtStartup(), as it is stored; and `takesAnyText`, false where only host names
/// and addresses are stored.
template <typename Machine>
struct NetworkTimeContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(NetworkTimeContract);

TYPED_TEST_P(NetworkTimeContract, runsBetweenStartAndStop) {
  auto& client = this->machine.service();
  EXPECT_FALSE(client.isRunning());
  for (int times = 0; times < 2; ++times) {
    client.start();
    client.start();
    EXPECT_TRUE(client.isRunning());
    client.stop();
    EXPECT_FALSE(client.isRunning());
  }
}

TYPED_TEST_P(NetworkTimeContract, keepsLaunchAtStartupApartFromRunning) {
  auto& client = this->machine.service();
  EXPECT_FALSE(this->machine.launchesAtStartup());
  client.setLaunchAtStartup(true);
  EXPECT_TRUE(this->machine.launchesAtStartup());
  EXPECT_FALSE(client.isRunning());
  client.setLaunchAtStartup(false);
  EXPECT_FALSE(this->machine.launchesAtStartup());
}

TYPED_TEST_P(NetworkTimeContract, answersTheServerThatWasSetLast) {
  auto& client = this->machine.service();
  EXPECT_EQ(client.server().address, "");
  for (const char* address : {"time.example", "192.0.2.7", "2001:db8::7"}) {
    client.setServer({address});
    EXPECT_EQ(client.server().address, address);
  }
  client.restartAsynchronously();
  EXPECT_FALSE(client.isRunning());
  EXPECT_EQ(client.server().address, "2001:db8::7");
}

TYPED_TEST_P(NetworkTimeContract, storesTextThatIsNoHostNameWholeOrNotAtAll) {
  auto& client = this->machine.service();
  client.setServer({"time.example"});
  for (const char* text : {"two words", "time.example\npool evil.example", "Zeit\xC3\xBC.example", "a;b#c"}) {
    client.setServer({text});
    EXPECT_EQ(client.server().address, TypeParam::takesAnyText ? text : "time.example");
  }
}

REGISTER_TYPED_TEST_SUITE_P(NetworkTimeContract, runsBetweenStartAndStop, keepsLaunchAtStartupApartFromRunning,
                            answersTheServerThatWasSetLast, storesTextThatIsNoHostNameWholeOrNotAtAll);

}  // namespace tavisk
