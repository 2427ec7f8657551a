// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <unistd.h>

#include "hosts/linux/LinuxTree.h"
#include "platform/AdminAuthenticatorContract.h"

namespace tavisk {
namespace {

TEST(LinuxUserDatabase, AnswersForTheProcessAndTheMachine) {
  LinuxTree tree;
  auto& users = tree.host().users();
  EXPECT_EQ(users.realUserId(), ::getuid());
  EXPECT_EQ(users.supplementaryGroups(65536)->size(), static_cast<std::size_t>(::getgroups(0, nullptr)));
  EXPECT_EQ(users.groupNamed("root"), 0U);
  for (const char* name : {"", "Root", "root ", "no such group"}) EXPECT_EQ(users.groupNamed(name), std::nullopt);
}

struct LinuxAuthenticator {
  AdminAuthenticator& service() { return tree.host().authenticator(); }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, AdminAuthenticatorContract, LinuxAuthenticator);

}  // namespace
}  // namespace tavisk
