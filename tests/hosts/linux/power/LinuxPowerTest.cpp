// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/power/PowerTree.h"
#include "platform/PowerControllerContract.h"
#include "platform/PowerSettingsContract.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::HasSubstr, testing::Not;

const PowerSource mains{"AC Power"};

struct LinuxPower {
  PowerSettingsService& service() { return tree.power(); }
  void lack(PowerSwitch which) {
    switch (which) {
      case PowerSwitch::wakeOnModem:
        return tree.remove("/sys/devices/pnp0/00:04/power/wakeup");
      case PowerSwitch::wakeOnNetworkAccess:
        return tree.remove("/sys/devices/pci0000:00/eth0-slot/power/wakeup");
      case PowerSwitch::restartAfterPowerFailure:
        tree.controllerLink.policies = 0x01;
        return;
      case PowerSwitch::powerButtonSleep:
        tree.remove("/sys/bus/acpi/devices/LNXPWRBN:00");
    }
  }
  PowerTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, PowerSettingsContract, LinuxPower);

TEST(LinuxPower, ComputerSleepIsInForceAndKept) {
  PowerTree tree;
  tree.power().setOn(PowerSwitch::powerButtonSleep, mains, true);
  tree.power().setUntilSleep(SleepTimer::computer, mains, {20});
  EXPECT_EQ(tree.bus.sleepsAfter(), "20min");
  EXPECT_EQ(tree.file("/etc/systemd/logind.conf.d/60-tavisk.conf"),
            "# Written by tavisk. Changes made here are replaced.\n"
            "[Login]\nHandlePowerKey=suspend\nIdleAction=suspend\nIdleActionSec=20min\n");
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr("nightly-backup"),
                                     Not(HasSubstr("NetworkManager"))));
  tree.write("/etc/systemd/logind.conf.d/70-other.conf", "[Login]\nIdleAction=ignore\n");
  tree.power().setUntilSleep(SleepTimer::computer, mains, {30});
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("70-other.conf")));

  tree.bus.maskSleep();
  tree.power().setUntilSleep(SleepTimer::computer, mains, {40});
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"not supported")"), HasSubstr("suspend.target")));
  tree.bus.canSuspend("na");
  tree.power().setUntilSleep(SleepTimer::computer, mains, {40});
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"not supported")"), HasSubstr("cannot sleep")));
  EXPECT_FALSE(tree.power().supports(PowerSwitch::powerButtonSleep, mains));
}

TEST(LinuxPower, DisplaySleepAboveAnHourIsAWish) {
  PowerTree tree;
  tree.power().setUntilSleep(SleepTimer::display, mains, {120});
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr(R"("live":"60")"),
                                     HasSubstr(R"("stored":"120")"), HasSubstr("60 minutes at the latest")));
  EXPECT_THAT(tree.file("/etc/tmpfiles.d/60-tavisk.conf"), HasSubstr("\nw /dev/tty1 - - - - \\033[9;120]\n"));
  tree.power().setUntilSleep(SleepTimer::display, mains, {120});
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"unchanged")"));
  tree.remove("/dev/tty1");
  tree.power().setUntilSleep(SleepTimer::display, mains, {5});
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"not supported")"));
}

TEST(LinuxPower, EveryDiskWithAMotorSleeps) {
  PowerTree tree;
  tree.addDisk("sdb");
  tree.addDisk("sdc");
  tree.write("/sys/block/sdc/queue/rotational", "0\n");
  tree.write("/etc/systemd/system/multi-user.target.wants/x", "");
  tree.link("/etc/systemd/system/multi-user.target.wants/tlp.service", "/lib/systemd/system/tlp.service");
  tree.power().setUntilSleep(SleepTimer::hardDisk, mains, {10});
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr("TLP")));
  EXPECT_EQ(tree.diskFile("sdb", "power/autosuspend_delay_ms") + tree.diskFile("sdb", "power/control"), "600000auto");
  EXPECT_EQ(tree.diskFile("sdc", "power/control"), "on\n");
  EXPECT_THAT(tree.file("/etc/udev/rules.d/60-tavisk-disk-sleep.rules"),
              HasSubstr(R"(ATTR{device/power/autosuspend_delay_ms}="600000", ATTR{device/power/control}="auto")"));

  tree.write("/sys/block/sda/device/power/control", "on\n");
  EXPECT_EQ(tree.power().untilSleep(SleepTimer::hardDisk, mains).count, 10U);
  EXPECT_THAT(tree.lastTold(), HasSubstr("10 on sdb, 0 on sda"));
  tree.power().setUntilSleep(SleepTimer::hardDisk, mains, {10});
  EXPECT_EQ(tree.diskFile("sda", "power/control"), "auto");

  // The kernel would let such disks turn on.
  for (const auto* disk : {"sda", "sdb"})
    tree.write(std::string("/sys/block/") + disk + "/device/scsi_disk/0:0:0:0/manage_runtime_start_stop", "0\n");
  tree.power().setUntilSleep(SleepTimer::hardDisk, mains, {20});
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"not supported")"));
}

TEST(LinuxPower, EveryCardThatCanIsSetAndAskedAgain) {
  PowerTree tree;
  tree.addCard("eth1", {{0x20, 0}});
  tree.addCard("eth2", {{0x01, 0}});
  tree.addCard("eth3", {{0x20, 0}});
  tree.remove("/sys/devices/pci0000:00/eth3-slot/power/wakeup");
  tree.write("/sys/class/net/eth1/ifindex", "7\n");
  tree.write("/run/udev/data/n7", "I:1\nE:ID_NET_LINK_FILE=/usr/lib/systemd/network/73-usb-net-by-mac.link\n");
  tree.power().setOn(PowerSwitch::wakeOnNetworkAccess, mains, true);
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"applied")"));
  for (const auto& [card, modes] : {std::pair("eth0", 0x20U), {"eth1", 0x20U}, {"eth2", 0U}, {"eth3", 0U}})
    EXPECT_EQ(tree.cards.cards[card].modes.enabled, modes) << card;
  for (const auto* file : {"99-default.link", "73-usb-net-by-mac.link"})
    EXPECT_THAT(tree.file(std::string("/etc/systemd/network/") + file + ".d/60-tavisk.conf"),
                HasSubstr("[Link]\nWakeOnLan=magic\n"));

  tree.cards.cards["eth1"].obeys = false;
  tree.power().setOn(PowerSwitch::wakeOnNetworkAccess, mains, false);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("on on eth1, off on eth0")));
  EXPECT_TRUE(tree.power().isOn(PowerSwitch::wakeOnNetworkAccess, mains));
}

TEST(LinuxPower, ThePlaceOfAPortWakesNotItsTerminal) {
  PowerTree tree;
  tree.addPort("ttyS1", "00:05");
  tree.remove("/sys/devices/pnp0/00:05/power");
  tree.power().setOn(PowerSwitch::wakeOnModem, mains, true);
  EXPECT_EQ(tree.file("/sys/devices/pnp0/00:04/power/wakeup"), "enabled");
  EXPECT_EQ(tree.file("/sys/class/tty/ttyS0/power/wakeup"), "disabled\n");
  EXPECT_THAT(tree.file("/etc/udev/rules.d/60-tavisk-wake-on-ring.rules"),
              HasSubstr(R"(SUBSYSTEM=="pnp", DRIVER=="serial", TEST=="power/wakeup", ATTR{power/wakeup}="enabled")"));
}

TEST(LinuxPower, RecordedMachinesChangeOnlyWhatCan) {
  PowerTree guest("guest.devices");
  guest.power().setOn(PowerSwitch::wakeOnNetworkAccess, mains, true);
  guest.power().setOn(PowerSwitch::wakeOnModem, mains, true);
  for (const auto* card : {"eth0", "eth1", "eth2", "eth3", "eth4"})
    EXPECT_EQ(guest.cards.cards[card].modes.enabled, card == std::string("eth0") ? magicPacket : 0) << card;
  EXPECT_EQ(guest.file("/sys/devices/pnp0/00:03/power/wakeup"), "enabled");
  EXPECT_FALSE(guest.delays().serviceOfClass("VelmarKCS"));

  PowerTree server("server.devices");
  server.power().setUntilSleep(SleepTimer::hardDisk, mains, {5});
  EXPECT_EQ(server.file("/sys/block/sda/device/power/control"), "auto");
  EXPECT_EQ(server.file("/sys/block/sdb/device/power/control"), "on\n") << "it has no motor";
  for (const auto which : {PowerSwitch::wakeOnNetworkAccess, PowerSwitch::wakeOnModem})
    EXPECT_FALSE(server.power().supports(which, mains));
  EXPECT_TRUE(server.delays().serviceOfClass("VelmarKCS"));
}

TEST(LinuxPower, RestartComesFromTheControllerElseTheFirmware) {
  PowerTree tree;
  tree.controllerLink.policies = 0x03;
  tree.power().setOn(PowerSwitch::restartAfterPowerFailure, mains, true);
  EXPECT_EQ(tree.controllerLink.policy, 1) << "as before, where it cannot always turn on";

  tree.controllerLink.error = EBUSY;
  EXPECT_TRUE(tree.power().supports(PowerSwitch::restartAfterPowerFailure, mains)) << "it did not say";
  tree.controllerLink.error = ENODEV;
  const std::string attribute = "/sys/class/firmware-attributes/maker/attributes/PowerBack/";
  tree.write(attribute + "current_value", "Last\n");
  tree.write(attribute + "possible_values", "Stay Off;Start;Last\n");
  EXPECT_FALSE(tree.power().supports(PowerSwitch::restartAfterPowerFailure, mains));
  tree.write("/etc/tavisk/firmware-attributes.conf", "# our machines\nPowerBack = Start ; Stay Off\n");
  EXPECT_TRUE(tree.power().isOn(PowerSwitch::restartAfterPowerFailure, mains));
  tree.power().setOn(PowerSwitch::restartAfterPowerFailure, mains, false);
  EXPECT_EQ(tree.file(attribute + "current_value"), "Stay Off");
  EXPECT_THAT(tree.lastTold(), HasSubstr("next start"));
}

TEST(LinuxPower, FreezeNeedsWatchdogAndKernel) {
  PowerTree tree;
  tree.write("/proc/sys/kernel/panic", "5\n");
  EXPECT_TRUE(tree.power().restartsAfterFreeze());
  EXPECT_THAT(tree.lastTold(), HasSubstr("on after a kernel panic only"));
  tree.power().setRestartsAfterFreeze(true);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr(R"("live":"on")")));
  EXPECT_THAT(tree.file("/etc/systemd/system.conf.d/60-tavisk.conf"), HasSubstr("[Manager]\nRuntimeWatchdogSec=60\n"));
  EXPECT_THAT(tree.file("/etc/sysctl.d/60-tavisk.conf"), HasSubstr("kernel.panic = 10\n"));
  tree.write("/sys/class/watchdog/watchdog0/state", "active\n");
  tree.write("/sys/class/watchdog/watchdog0/nowayout", "1\n");
  tree.power().setRestartsAfterFreeze(false);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("nowayout"),
                                     HasSubstr(R"("live":"on by the watchdog only")"), HasSubstr(R"("stored":"off")")));
  tree.write("/proc/sys/kernel/panic", "10\n");
  tree.write("/sys/class/watchdog/watchdog0/state", "inactive\n");
  tree.power().restartsAfterFreeze();
  EXPECT_THAT(tree.lastTold(), HasSubstr("on after a kernel panic only")) << "the service manager could not open it";
  tree.bus.startAgain();
  tree.power().setRestartsAfterFreeze(false);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr(R"("live":"off")")));
  tree.write("/etc/sysctl.d/99-sysctl.conf", "kernel.panic=0\n");
  tree.power().setRestartsAfterFreeze(true);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("on by the watchdog only")));

  tree.remove("/dev/watchdog0");
  tree.power().setRestartsAfterFreeze(false);
  EXPECT_THAT(tree.lastTold(), HasSubstr("not one that hangs"));
}

TEST(LinuxPower, AMachineWithoutServicesSaysWhatLasts) {
  PowerTree tree;
  tree.remove("/run/systemd/system");
  tree.remove("/run/udev/control");
  auto& power = tree.power();
  power.setUntilSleep(SleepTimer::computer, mains, {10});
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"not supported")"));
  power.setRestartsAfterFreeze(true);
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"applied")"));
  power.setUntilSleep(SleepTimer::hardDisk, mains, {10});
  EXPECT_THAT(tree.lastTold(), HasSubstr("lasts until the restart"));
}

struct LinuxController {
  static constexpr const char* className = "VelmarKCS";
  PowerController& service() { return tree.delays(); }
  void refuseDelays() { tree.controllerLink.delayRefusal = 0xC0; }
  const std::vector<Effect>& effects() { return tree.log.effects; }
  PowerTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, PowerControllerContract, LinuxController);

/// Sets units through the whole conversation; the first status that is not 0.
ControllerStatus setDelay(PowerTree& tree, std::uint8_t units) {
  PropertyList::Dictionary properties;
  properties.set("ServerID", PropertyList::Data{units});
  const auto [status, connection] = tree.delays().open(tree.delays().serviceOfClass("VelmarKCS"), 0x0101FACE);
  return status != 0 ? status : tree.delays().setProperties(connection, properties);
}

std::optional<std::int64_t> delayOf(PowerTree& tree) {
  return tree.delays().numberProperty({"VelmarKCS"}, "ServerID");
}

TEST(LinuxPowerController, KeepsTheDelayInTheController) {
  PowerTree tree;
  EXPECT_EQ(setDelay(tree, 255), 0);
  EXPECT_EQ(tree.controllerLink.delay, (std::vector<std::uint8_t>{0x1D, 0xE2})) << "7650 seconds, high byte first";
  EXPECT_EQ(delayOf(tree), 255);
  EXPECT_THAT(tree.lastTold(), HasSubstr("units of 30 seconds"));
}

TEST(LinuxPowerController, StatusesAreTheControllersAnswers) {
  for (const auto& [code, status] : {std::pair(0xC0, EBUSY),
                                     {0xC1, ENOSYS},
                                     {0xC7, EINVAL},
                                     {0xCC, EINVAL},
                                     {0xD4, EACCES},
                                     {0xC3, ETIMEDOUT},
                                     {0xFF, EIO}}) {
    PowerTree tree;
    tree.controllerLink.delayRefusal = static_cast<std::uint8_t>(code);
    EXPECT_EQ(setDelay(tree, 3), status);
    EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"failed")"));
  }
  PowerTree tree;
  tree.controllerLink.maker = 0x58;
  EXPECT_EQ(setDelay(tree, 3), ENOSYS);
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"not supported")"), HasSubstr("manufacturer 344")));
  EXPECT_EQ(delayOf(tree), std::nullopt);
  tree.controllerLink.error = ETIMEDOUT;
  EXPECT_EQ(setDelay(tree, 3), ETIMEDOUT);
  tree.remove("/sys/class/ipmi");
  EXPECT_EQ(setDelay(tree, 3), ENODEV);
}

TEST(LinuxPowerController, TakesTheAdministratorsRequests) {
  constexpr const char* file = "/etc/tavisk/startup-delay.conf";
  PowerTree tree;
  tree.controllerLink.maker = 0x58;
  tree.write(file, "# rack 7\nmanufacturer=344 netfn=0x30 set=0x54 width=2 order=little unit=10\n");
  EXPECT_EQ(setDelay(tree, 100), 0);
  EXPECT_EQ(tree.controllerLink.delay, (std::vector<std::uint8_t>{0x2C, 0x01}));
  EXPECT_EQ(delayOf(tree), 100) << "a wish, as this controller does not tell";
  for (const auto* line : {"manufacturer=344 netfn=0x30 set=0x54 width=1 order=little unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=little unit=7"}) {
    tree.write(file, line);
    EXPECT_EQ(setDelay(tree, 100), EINVAL) << line;
  }
  for (const auto* line : {"manufacturer=344 netfn=0x30 set=0x154 width=2 order=big unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=5 order=big unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=big unit=0",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=big unit=1 more=1"}) {
    tree.write(file, line);
    EXPECT_EQ(setDelay(tree, 100), ENOSYS) << line;
    EXPECT_THAT(tree.lastTold(), HasSubstr("not understood")) << line;
  }
}

}  // namespace
}  // namespace tavisk
