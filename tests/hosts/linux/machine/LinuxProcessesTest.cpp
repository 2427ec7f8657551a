// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectMatchers.h"
#include "hosts/linux/FakeServiceManager.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk {
namespace {

TEST(LinuxProcessTermination, TellsOfAShutdownThatItCannotDelay) {
  LinuxTree tree;
  tree.host().processTermination().disable();
  tree.host().processTermination().enable();
  EXPECT_THAT(tree.log.effects, testing::IsEmpty()) << "nobody keeps logins here";
  tree.write("/run/systemd/system/x", "");
  FakeServiceManager logins(tree.at("/run/dbus/system_bus_socket"));
  logins.breakNext("Inhibit", FakeServiceManager::Fault::error);
  tree.host().processTermination().disable();
  EXPECT_THAT(tree.log.effects, testing::ElementsAre(FailedFor("Inhibit on /org/freedesktop/login1")));
}

}  // namespace
}  // namespace tavisk
