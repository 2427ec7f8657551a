// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "platform/Authorization.h"

namespace tavisk {

/// `Machine` offers: service().
template <typename Machine>
struct AdminAuthenticatorContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(AdminAuthenticatorContract);

TYPED_TEST_P(AdminAuthenticatorContract, holdsTheAuthorizationUntilItIsGivenUp) {
  auto& authenticator = this->machine.service();
  EXPECT_FALSE(authenticator.isAuthenticated());
  authenticator.authenticate();
  EXPECT_TRUE(authenticator.isAuthenticated());
  authenticator.deauthenticate();
  EXPECT_FALSE(authenticator.isAuthenticated());
}

REGISTER_TYPED_TEST_SUITE_P(AdminAuthenticatorContract, holdsTheAuthorizationUntilItIsGivenUp);

}  // namespace tavisk
