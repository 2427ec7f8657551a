// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>

#include "OwnMounts.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/power/PowerTree.h"

namespace tavisk {
namespace {

using testing::Each, testing::SizeIs;

constexpr auto modem = PowerSwitch::wakeOnModem;
constexpr auto network = PowerSwitch::wakeOnNetworkAccess;
constexpr auto button = PowerSwitch::powerButtonSleep;
constexpr auto firmware = PowerSwitch::restartAfterPowerFailure;

/// What tells whether the machine can have a setting.
const std::pair<const char*, PowerSwitch> looks[] = {
    {"/sys/class/net", network},
    {"/sys/devices/pci0000:00/eth0-slot/power/wakeup", network},
    {"/sys/class/tty", modem},
    {"/sys/devices/pnp0/00:04/power/wakeup", modem},
    {"/sys/bus/acpi/devices", button},
    {"/run/dbus/system_bus_socket", button},
    {"/sys/class/firmware-attributes", firmware},
    {"/sys/class/firmware-attributes/maker/attributes/AcPwrRcvry/possible_values", firmware},
    {"/etc/tavisk/firmware-attributes.conf", firmware},
};

TEST(PowerFaults, WhatCannotBeLookedAtIsAFailureAndNotALack) {
  for (const auto& [path, which] : looks) {
    SCOPED_TRACE(path);
    PowerTree tree;
    tree.controllerLink.error = which == firmware ? ENODEV : 0;
    tree.write("/sys/class/firmware-attributes/maker/attributes/Other/possible_values", "On;Off\n");
    tree.makeUnreadable(path);
    tree.turn(which, true);
    EXPECT_FALSE(tree.power().supports(which, tree.mains));
    EXPECT_FALSE(tree.power().canSet(which, tree.mains));
    EXPECT_THAT(tree.log.effects, SizeIs(3));
    EXPECT_THAT(tree.log.effects, Each(FailedFor("symbolic links")));
  }
}

TEST(PowerFaults, OwnFilesThatCannotBeReadStayAsTheyAre) {
  const std::string tooLong((std::size_t{1} << 20U) + 1, '#');
  for (const auto& [path, which] : {std::pair("/etc/udev/rules.d/60-tavisk-wake-on-ring.rules", modem),
                                    {"/etc/systemd/network/99-default.link.d/60-tavisk.conf", network},
                                    {"/etc/systemd/logind.conf.d/60-tavisk.conf", button}}) {
    PowerTree tree;
    tree.write(path, tooLong);
    EXPECT_EQ(tree.turn(which, true).outcome, Outcome::failed) << path;
    EXPECT_EQ(tree.file(path).size(), tooLong.size()) << path;
  }
}

TEST(PowerFaults, FilesThatAreMaskedSayNothing) {
  PowerTree tree;
  tree.write("/dev/null", "");
  for (const auto* file : {"/etc/systemd/logind.conf.d/10-other.conf", "/etc/sysctl.d/10-other.conf"})
    tree.link(file, "/dev/null");
  std::filesystem::remove(tree.at("/dev/null"));
  ::mkfifo(tree.at("/dev/null").c_str(), 0600);
  EXPECT_EQ(tree.set(SleepTimer::computer, {20}).outcome, Outcome::applied);
  EXPECT_EQ(tree.setRestartsAfterFreeze(true).outcome, Outcome::applied);
}

TEST(PowerFaults, ComputerSleepThatIsHalfMadeIsCompleted) {
  PowerTree tree;
  tree.write("/etc/systemd/logind.conf.d/60-tavisk.conf", "[Login]\nIdleAction=suspend\nIdleActionSec=20min\n");
  tree.turn(PowerSwitch::powerButtonSleep, true);
  EXPECT_EQ(tree.bus.sleepsAfter(), "20min") << "the service tells this time, so it has to go by it";
}

TEST(PowerFaults, RestartAfterFreezeIsInBothFilesOrInNone) {
  PowerTree tree;
  tree.write("/etc/systemd/system.conf.d", "in the place of the folder");
  const auto effect = tree.setRestartsAfterFreeze(true);
  EXPECT_THAT(effect, FailedFor("Not a directory"));
  EXPECT_EQ(effect.where, "");
  EXPECT_FALSE(tree.has("/etc/sysctl.d/60-tavisk.conf"));
}

TEST(PowerFaults, RestartAfterFreezeIsNothingThatAContainerCanHave) {
  PowerTree tree;
  const bool isProven = withOwnMounts([&tree] {
    const auto panic = tree.at("/proc/sys/kernel/panic");
    for (const auto more : {0UL, 0UL | MS_REMOUNT | MS_RDONLY})
      ASSERT_EQ(::mount(panic.c_str(), panic.c_str(), nullptr, MS_BIND | more, nullptr), 0);
    EXPECT_EQ(tree.setRestartsAfterFreeze(true).outcome, Outcome::failed) << "there is a watchdog";
    tree.setRestartsAfterFreeze(false);
    tree.remove("/dev/watchdog0");
    const auto former = tree.file("/etc/systemd/system.conf.d/60-tavisk.conf");
    EXPECT_THAT(tree.setRestartsAfterFreeze(true), UnsupportedFor("read-only"));
    EXPECT_EQ(tree.file("/etc/systemd/system.conf.d/60-tavisk.conf"), former);
    EXPECT_FALSE(tree.has("/etc/sysctl.d/60-tavisk.conf"));
  });
  if (!isProven) GTEST_SKIP() << "may not mount";
}

}  // namespace
}  // namespace tavisk
