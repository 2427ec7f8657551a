// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "platform/NameServices.h"

namespace tavisk {

/// `Machine` offers: configuration() and store(), where a name that is set is live at once.
template <typename Machine>
struct HostNamesContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(HostNamesContract);

TYPED_TEST_P(HostNamesContract, goByTheNamesThatWereSetLast) {
  const auto session = this->machine.store().open("test");
  ASSERT_TRUE(session);
  this->machine.configuration().setLocalNetworkName("mail-server-2");
  for (const char* name : {"Mail Server 2", R"(Z"$\`rich 'a' #1)", "Z\xC3\xBCrich", "  "}) {
    this->machine.configuration().setComputerName(name);
    EXPECT_EQ(session->computerName(), name);
  }
  EXPECT_EQ(session->localHostName(), "mail-server-2");
}

REGISTER_TYPED_TEST_SUITE_P(HostNamesContract, goByTheNamesThatWereSetLast);

}  // namespace tavisk
