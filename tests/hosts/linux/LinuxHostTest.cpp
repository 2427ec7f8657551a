// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/LinuxContractMachines.h"
#include "platform/AdminAuthenticatorContract.h"
#include "platform/BootLoaderFileContract.h"

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

INSTANTIATE_TYPED_TEST_SUITE_P(Linux, ClockContract, ClockOf<LinuxTree>);

struct LinuxBootLoader {
  BootLoaderFile& service() { return tree.host().bootLoaderFile(); }
  void put(const std::string& path, const char* contents) { tree.write(path, contents); }
  std::string file(const std::string& path) { return tree.file(path); }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, BootLoaderFileContract, LinuxBootLoader);

}  // namespace
}  // namespace tavisk
