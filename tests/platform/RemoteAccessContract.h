// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

namespace tavisk {

/// Of remote shell and remote events. `Machine` offers: service(), which is off at first.
template <typename Machine>
struct RemoteAccessContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(RemoteAccessContract);

TYPED_TEST_P(RemoteAccessContract, isWhatItWasSetToLast) {
  auto& service = this->machine.service();
  EXPECT_FALSE(service.isEnabled());
  for (const bool enabled : {true, true, false, false, true}) {
    service.setEnabled(enabled);
    EXPECT_EQ(service.isEnabled(), enabled);
  }
}

REGISTER_TYPED_TEST_SUITE_P(RemoteAccessContract, isWhatItWasSetToLast);

}  // namespace tavisk
