// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/MachineLock.h"

namespace tavisk {
namespace {

class MachineLockTest : public testing::Test {
 protected:
  unsigned modeOf(const char* path) const {
    struct stat status {};
    ::stat(tree.at(path).c_str(), &status);
    return status.st_mode & 07777U;
  }

  LinuxTree tree;
  MachineLock lock{tree.root, tree.runLoop};
};

TEST_F(MachineLockTest, isForMembersAloneAndClosedToStartedPrograms) {
  const auto held = lock.hold();
  ASSERT_TRUE(held);
  EXPECT_EQ(modeOf("/run/tavisk"), 0750U);
  EXPECT_EQ(modeOf("/run/tavisk/lock"), 0660U);
  EXPECT_EQ(::fcntl(held->number(), F_GETFD), FD_CLOEXEC);
}

TEST_F(MachineLockTest, waitsForItsHolderAndThenNamesIt) {
  auto held = lock.hold();
  ASSERT_TRUE(held);
  {
    const auto limit = tree.runLoop.limitWaits(std::chrono::milliseconds(30));
    const auto refused = lock.hold();
    ASSERT_FALSE(refused);
    EXPECT_EQ(refused.failure().why,
              "process " + std::to_string(::getpid()) + " is changing a setting of this machine");
  }
  const auto release = tree.runLoop.after(std::chrono::milliseconds(20), [&] { held = Failure{}; });
  EXPECT_TRUE(lock.hold());
}

TEST_F(MachineLockTest, isNotTakenForFreeWhereItCannotBeOpened) {
  tree.write("/run/tavisk/other", "");
  tree.link("/run/tavisk/lock", "other");
  EXPECT_EQ(lock.hold().failure().code, std::errc::too_many_symbolic_link_levels);
}

}  // namespace
}  // namespace tavisk
