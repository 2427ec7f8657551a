// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/UserDatabase.h"

namespace tavisk {

/// `Machine` offers: service(); haveUser(id, groups); haveGroup(name, id), after which the group database has just
/// what it was given; and `choosesUser`, false where the user is the one who runs the tests.
template <typename Machine>
class UserDatabaseContract : public testing::Test {
 protected:
  Machine machine;
};

TYPED_TEST_SUITE_P(UserDatabaseContract);

TYPED_TEST_P(UserDatabaseContract, knowsWhoRunsTheTool) {
  if (!TypeParam::choosesUser) return;
  this->machine.haveUser(501, {20, 80});
  EXPECT_EQ(this->machine.service().realUserId(), 501U);
  EXPECT_THAT(this->machine.service().supplementaryGroups(16).value(), testing::ElementsAre(20, 80));
}

TYPED_TEST_P(UserDatabaseContract, hasNoAnswerForMoreGroupsThanThereIsRoomFor) {
  if (!TypeParam::choosesUser) return;
  std::vector<GroupId> groups(16, 7);
  this->machine.haveUser(501, groups);
  EXPECT_EQ(this->machine.service().supplementaryGroups(16), groups);
  groups.push_back(8);
  this->machine.haveUser(501, groups);
  EXPECT_EQ(this->machine.service().supplementaryGroups(16), std::nullopt);
}

TYPED_TEST_P(UserDatabaseContract, findsGroupsByTheirExactName) {
  this->machine.haveGroup("staff", 20);
  EXPECT_EQ(this->machine.service().groupNamed("staff"), 20U);
  for (const char* name : {"", "Staff", "staf", "staff ", "admin"})
    EXPECT_EQ(this->machine.service().groupNamed(name), std::nullopt) << name;
}

REGISTER_TYPED_TEST_SUITE_P(UserDatabaseContract, knowsWhoRunsTheTool, hasNoAnswerForMoreGroupsThanThereIsRoomFor,
                            findsGroupsByTheirExactName);

}  // namespace tavisk
