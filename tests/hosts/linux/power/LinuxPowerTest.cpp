// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectMatchers.h"
#include "hosts/linux/power/PowerTree.h"
#include "platform/PowerControllerContract.h"
#include "platform/PowerSettingsContract.h"

namespace tavisk {
namespace {

using testing::HasSubstr;

struct LinuxPower {
  PowerSettingsService& service() { return tree.power(); }
  void lack(PowerSwitch which) {
    static const std::map<PowerSwitch, const char*> files = {
        {PowerSwitch::wakeOnModem, "/sys/devices/pnp0/00:04/power/wakeup"},
        {PowerSwitch::wakeOnNetworkAccess, "/sys/devices/pci0000:00/eth0-slot/power/wakeup"},
        {PowerSwitch::powerButtonSleep, "/sys/bus/acpi/devices/LNXPWRBN:00"}};
    if (files.contains(which)) return tree.remove(files.at(which));
    tree.controllerLink.policies = 0x01;
  }
  const std::vector<Effect>& effects() { return tree.log.effects; }
  const std::vector<SettingValue>& values() { return tree.log.values; }
  PowerTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, PowerSettingsContract, LinuxPower);

struct PowerTest : testing::Test {
  PowerTree tree;
};

TEST_F(PowerTest, ComputerSleepIsInForceAndKept) {
  tree.turn(PowerSwitch::powerButtonSleep, true);
  const auto effect = tree.set(SleepTimer::computer, {20});
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.undoneBy, "nightly-backup") << "the other one only delays sleep";
  EXPECT_EQ(tree.bus.sleepsAfter(), "20min");
  EXPECT_EQ(tree.file(effect.where),
            "# Written by tavisk. Changes made here are replaced.\n"
            "[Login]\nHandlePowerKey=suspend\nIdleAction=suspend\nIdleActionSec=20min\n");
}

TEST(ComputerSleep, NeedsAMachineThatCanSleep) {
  PowerTree masked;
  masked.bus.unitState = "masked";
  const auto effect = masked.set(SleepTimer::computer, {40});
  EXPECT_EQ(effect.outcome, Outcome::notSupported);
  EXPECT_EQ(effect.failure->on, "suspend.target");
  masked.bus.canSuspend = nullptr;
  EXPECT_THAT(masked.set(SleepTimer::computer, {40}), UnsupportedFor("systemd-logind.service: it is masked"));

  PowerTree sleepless;
  for (const auto* answer : {"na", "org.freedesktop.DBus.Error.FileNotFound"}) {
    sleepless.bus.canSuspend = answer;
    EXPECT_THAT(sleepless.set(SleepTimer::computer, {40}), UnsupportedFor("this machine cannot sleep")) << answer;
  }
  EXPECT_FALSE(sleepless.power().supports(PowerSwitch::powerButtonSleep, sleepless.mains));
}

TEST_F(PowerTest, ComputerSleepIsReadFromEveryLengthOfTime) {
  tree.log.wants = true;
  for (const auto& [time, minutes] : {std::pair("infinity", "0"),
                                      {"", "30"},
                                      {"90", "2"},
                                      {"1.5h 30s", "91"},
                                      {"2w", "20160"},
                                      {"1month", "43830"},
                                      {"1M 1m", "43831"},
                                      {"1y", "525960"},
                                      {"5\u00b5s", "1"}}) {
    tree.write("/etc/systemd/logind.conf", std::string("[Login]\nIdleAction=suspend\nIdleActionSec=") + time + "\n");
    tree.power().untilSleep(SleepTimer::computer, tree.mains);
    EXPECT_EQ(tree.log.values.back().stored, minutes) << time;
  }
  for (const auto* time : {"soon", "5 parsecs", "1.5.5h", "-1"}) {
    tree.write("/etc/systemd/logind.conf", std::string("[Login]\nIdleAction=suspend\nIdleActionSec=") + time + "\n");
    tree.power().untilSleep(SleepTimer::computer, tree.mains);
    EXPECT_THAT(tree.lastEffect(), FailedFor(std::string("no length of time: ") + time));
  }
}

TEST_F(PowerTest, DisplaySleepAboveAnHourIsAWish) {
  const auto effect = tree.set(SleepTimer::display, {120});
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.live, "60");
  EXPECT_EQ(effect.stored, "120");
  EXPECT_EQ(effect.note, "the kernel blanks its console after 60 minutes at the latest");
  EXPECT_THAT(tree.file(effect.where), HasSubstr("\nw /dev/tty1 - - - - \\033[9;120]\n"));
  EXPECT_EQ(tree.set(SleepTimer::display, {120}).outcome, Outcome::unchanged);
  std::filesystem::remove(tree.at(effect.where));
  tree.write("/proc/cmdline", "quiet consoleblank=600\n");
  tree.log.wants = true;
  tree.power().untilSleep(SleepTimer::display, tree.mains);
  EXPECT_EQ(tree.log.values.back().live, "60");
  EXPECT_EQ(tree.log.values.back().stored, "10") << "after the restart the kernel's command line is all there is";
  tree.remove("/dev/tty1");
  EXPECT_EQ(tree.set(SleepTimer::display, {5}).outcome, Outcome::notSupported);
}

TEST_F(PowerTest, HardDiskSleepStopsEveryDiskWithAMotor) {
  for (const auto* disk : {"sdb", "sdc", "sdd"}) tree.addDisk(disk);
  tree.write("/sys/block/sdc/queue/rotational", "0\n");
  tree.write("/sys/block/sdd/device/scsi_disk/0:0:0:0/manage_runtime_start_stop", "0\n");
  tree.link("/etc/systemd/system/multi-user.target.wants/tlp.service", "/lib/systemd/system/tlp.service");
  const auto effect = tree.set(SleepTimer::hardDisk, {10});
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.undoneBy, "TLP");
  EXPECT_EQ(tree.diskFile("sdb", "power/autosuspend_delay_ms") + tree.diskFile("sdb", "power/control"), "600000auto");
  EXPECT_EQ(tree.diskFile("sdc", "power/control"), "on\n") << "it has no motor";
  EXPECT_EQ(tree.diskFile("sdd", "power/control"), "on\n") << "the kernel would let it turn";
  EXPECT_EQ(effect.where, "/etc/udev/rules.d/60-tavisk-disk-sleep.rules");
  EXPECT_THAT(tree.file(effect.where),
              HasSubstr(R"(ATTR{device/power/autosuspend_delay_ms}="600000", ATTR{device/power/control}="auto")"));
}

TEST_F(PowerTest, HardDiskSleepOfDisksThatDifferIsToldForEach) {
  for (const auto* disk : {"sdb", "sdc"}) tree.addDisk(disk);
  tree.remove("/sys/block/sdc/device/power/control");  // it goes away
  EXPECT_EQ(tree.set(SleepTimer::hardDisk, {10}).outcome, Outcome::applied);
  tree.write("/sys/block/sda/device/power/control", "on\n");
  EXPECT_EQ(tree.power().untilSleep(SleepTimer::hardDisk, tree.mains), Minutes{10});
  EXPECT_EQ(tree.log.values.back().live, "10 on sdb, 0 on sda");
  tree.set(SleepTimer::hardDisk, {10});
  EXPECT_EQ(tree.diskFile("sda", "power/control"), "auto");
}

TEST_F(PowerTest, WakeOnNetworkAccessIsSetOnEveryCardThatCan) {
  tree.addCard("eth1", {{0x20, 0}});
  tree.addCard("eth2", {{0x01, 0}});
  tree.addCard("eth3", {{0x20, 0}});
  tree.remove("/sys/devices/pci0000:00/eth3-slot/power/wakeup");
  tree.write("/sys/class/net/eth1/ifindex", "7\n");
  tree.write("/run/udev/data/n7", "I:1\nE:ID_NET_LINK_FILE=/usr/lib/systemd/network/73-usb-net-by-mac.link\n");
  const auto effect = tree.turn(PowerSwitch::wakeOnNetworkAccess, true);
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.where,
            "/etc/systemd/network/73-usb-net-by-mac.link.d/60-tavisk.conf, "
            "/etc/systemd/network/99-default.link.d/60-tavisk.conf");
  for (const auto& [card, modes] : {std::pair("eth0", 0x20U), {"eth1", 0x20U}, {"eth2", 0U}, {"eth3", 0U}})
    EXPECT_EQ(tree.cards.cards[card].modes.enabled, modes) << card;
  for (const auto* file : {"99-default.link", "73-usb-net-by-mac.link"})
    EXPECT_THAT(tree.file(std::string("/etc/systemd/network/") + file + ".d/60-tavisk.conf"),
                HasSubstr("[Link]\nWakeOnLan=magic\n"));
}

TEST_F(PowerTest, WakeOnNetworkAccessOfFilesThatDifferIsToldForEach) {
  tree.write("/run/udev/data/n2", "E:ID_NET_LINK_FILE=/usr/lib/systemd/network/73-usb-net-by-mac.link\n");
  tree.write("/etc/systemd/network/73-usb-net-by-mac.link", "[Link]\nWakeOnLan=magic\n");
  tree.log.wants = true;
  EXPECT_FALSE(tree.power().isOn(PowerSwitch::wakeOnNetworkAccess, tree.mains));
  EXPECT_EQ(tree.log.values.back().stored, "on on 73-usb-net-by-mac.link, nothing on 99-default.link");
}

TEST_F(PowerTest, WakeOnNetworkAccessIsReadBackFromCardsThatIgnoreIt) {
  tree.addCard("eth1", {{0x20, 0x20}, false});
  const auto effect = tree.turn(PowerSwitch::wakeOnNetworkAccess, false);
  EXPECT_EQ(effect.outcome, Outcome::failed);
  EXPECT_EQ(effect.live, "on on eth1, off on eth0");
  EXPECT_TRUE(tree.power().isOn(PowerSwitch::wakeOnNetworkAccess, tree.mains));
  tree.makeUnreadable("/run/udev/data/n2");
  EXPECT_THAT(tree.turn(PowerSwitch::wakeOnNetworkAccess, true), FailedFor("symbolic links"));
}

TEST_F(PowerTest, WakeOnModemSetsThePlaceOfThePortNotItsTerminal) {
  tree.addPort("ttyS1", "00:05");
  tree.remove("/sys/devices/pnp0/00:05/power");
  tree.addPort("ttyS2", "00:06", "/00:06:0/00:06:0.0");
  const auto effect = tree.turn(PowerSwitch::wakeOnModem, true);
  EXPECT_EQ(tree.file("/sys/devices/pnp0/00:06/power/wakeup"), "enabled");
  EXPECT_EQ(tree.file("/sys/devices/pnp0/00:04/power/wakeup"), "enabled");
  EXPECT_EQ(tree.file("/sys/class/tty/ttyS0/power/wakeup"), "disabled\n");
  EXPECT_EQ(effect.where, "/etc/udev/rules.d/60-tavisk-wake-on-ring.rules");
  EXPECT_THAT(tree.file(effect.where),
              HasSubstr(R"(SUBSYSTEM=="pnp", DRIVER=="serial", TEST=="power/wakeup", ATTR{power/wakeup}="enabled")"));
}

TEST(LinuxPower, RecordedServerChangesOnlyWhatCan) {
  PowerTree server("server.devices");
  server.set(SleepTimer::hardDisk, {5});
  EXPECT_EQ(server.file("/sys/block/sda/device/power/control"), "auto");
  EXPECT_EQ(server.file("/sys/block/sdb/device/power/control"), "on\n") << "it has no motor";
  for (const auto which : {PowerSwitch::wakeOnNetworkAccess, PowerSwitch::wakeOnModem})
    EXPECT_FALSE(server.power().supports(which, server.mains));
  EXPECT_TRUE(server.delays().serviceOfClass(controllerClass));
}

TEST_F(PowerTest, RestartAfterPowerFailureComesFromTheController) {
  tree.controllerLink.policies = 0x03;
  tree.turn(PowerSwitch::restartAfterPowerFailure, true);
  EXPECT_EQ(tree.controllerLink.policy, 1) << "as before, where it cannot always turn on";
  tree.controllerLink.error = EBUSY;
  EXPECT_FALSE(tree.power().supports(PowerSwitch::restartAfterPowerFailure, tree.mains));
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed) << "it did not say";
}

TEST_F(PowerTest, RestartAfterPowerFailureComesFromTheFirmwareWithoutAController) {
  const std::string attribute = "/sys/class/firmware-attributes/maker/attributes/PowerBack/";
  tree.controllerLink.error = ENODEV;
  tree.write(attribute + "current_value", "Last\n");
  tree.write(attribute + "possible_values", "Stay Off;Start;Last\n");
  EXPECT_FALSE(tree.power().supports(PowerSwitch::restartAfterPowerFailure, tree.mains));
  tree.write("/etc/tavisk/firmware-attributes.conf", "# our machines\nPowerBack = Start ; Stay Off\n");
  EXPECT_TRUE(tree.power().isOn(PowerSwitch::restartAfterPowerFailure, tree.mains));
  EXPECT_EQ(tree.turn(PowerSwitch::restartAfterPowerFailure, false).note, "the firmware takes it up at the next start");
  EXPECT_EQ(tree.file(attribute + "current_value"), "Stay Off");
}

TEST_F(PowerTest, RestartAfterFreezeNeedsWatchdogAndKernel) {
  tree.write("/proc/sys/kernel/panic", "5\n");
  EXPECT_TRUE(tree.power().restartsAfterFreeze());
  EXPECT_EQ(tree.log.values.back().live, "on after a kernel panic only");
  const auto effect = tree.setRestartsAfterFreeze(true);
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.live, "on");
  EXPECT_THAT(tree.file("/etc/systemd/system.conf.d/60-tavisk.conf"), HasSubstr("[Manager]\nRuntimeWatchdogSec=60\n"));
  EXPECT_THAT(tree.file("/etc/sysctl.d/60-tavisk.conf"), HasSubstr("kernel.panic = 10\n"));

  tree.write("/sys/class/watchdog/watchdog0/state", "inactive\n");
  tree.power().restartsAfterFreeze();
  EXPECT_EQ(tree.log.values.back().live, "on after a kernel panic only") << "the service manager could not open it";
}

TEST_F(PowerTest, RestartAfterFreezeStaysWithAWatchdogThatCannotBeStopped) {
  tree.setRestartsAfterFreeze(true);
  tree.bus.startAgain();
  EXPECT_EQ(tree.setRestartsAfterFreeze(false).live, "off");
  tree.setRestartsAfterFreeze(true);
  tree.write("/sys/class/watchdog/watchdog0/state", "active\n");
  tree.write("/sys/class/watchdog/watchdog0/nowayout", "1\n");
  const auto effect = tree.setRestartsAfterFreeze(false);
  EXPECT_EQ(effect.outcome, Outcome::failed);
  EXPECT_THAT(effect.failure->why, HasSubstr("nowayout"));
  EXPECT_EQ(effect.live, "on by the watchdog only");
  EXPECT_EQ(effect.stored, "off");
  tree.makeUnreadable("/sys/class/watchdog/watchdog0/nowayout");
  EXPECT_THAT(tree.setRestartsAfterFreeze(false), FailedFor("symbolic links"));
}

TEST_F(PowerTest, RestartAfterFreezeWithoutAWatchdogIsOfTheKernelAlone) {
  tree.makeUnreadable("/dev/watchdog0");
  EXPECT_THAT(tree.setRestartsAfterFreeze(true), FailedFor("symbolic links"));
  tree.remove("/dev/watchdog0");
  const auto effect = tree.setRestartsAfterFreeze(true);
  EXPECT_EQ(effect.live, "on");
  EXPECT_EQ(effect.note, "no watchdog here: only a kernel that has panicked restarts, not one that hangs");
  tree.remove("/proc/sys/kernel/panic");
  EXPECT_FALSE(tree.power().restartsAfterFreeze());
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  EXPECT_EQ(tree.lastEffect().where, "") << "what is in force was read, not what is kept";
}

TEST_F(PowerTest, PowerSettingsWithoutServicesSaysWhatLasts) {
  tree.remove("/run/systemd/system");
  tree.remove("/run/udev/control");
  EXPECT_EQ(tree.set(SleepTimer::computer, {10}).outcome, Outcome::notSupported);
  EXPECT_EQ(tree.setRestartsAfterFreeze(true).outcome, Outcome::applied);
  for (const auto& effect : {tree.set(SleepTimer::hardDisk, {10}), tree.turn(PowerSwitch::wakeOnNetworkAccess, true)}) {
    EXPECT_EQ(effect.note, "no device manager runs here: lasts until the restart");
    EXPECT_EQ(effect.where, "");
    EXPECT_EQ(effect.stored, std::nullopt);
  }
}

struct LinuxController {
  PowerController& service() { return tree.delays(); }
  void lackController() { tree.remove("/sys/class/ipmi"); }
  void refuseDelays() { tree.controllerLink.delayRefusal = 0xC0; }
  const std::vector<Effect>& effects() { return tree.log.effects; }
  const std::vector<SettingValue>& values() { return tree.log.values; }
  PowerTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, PowerControllerContract, LinuxController);

TEST_F(PowerTest, ControllerKeepsTheDelayInTheController) {
  EXPECT_EQ(setDelay(tree.delays(), 255), 0);
  EXPECT_EQ(tree.controllerLink.delay, (std::vector<std::uint8_t>{0x1D, 0xE2})) << "7650 seconds, high byte first";
  EXPECT_EQ(delayOf(tree.delays()), 255);
  EXPECT_EQ(tree.log.values.back().unit, "units of 30 seconds");
}

TEST_F(PowerTest, ControllerStatusesTellOfTheControllerAndTheWayToIt) {
  tree.controllerLink.error = ETIMEDOUT;
  EXPECT_EQ(setDelay(tree.delays(), 3), ETIMEDOUT);
  tree.controllerLink.error = 0;
  for (const auto& [code, status] :
       {std::pair(0xC0, EBUSY), {0xC7, EINVAL}, {0xCC, EINVAL}, {0xD4, EACCES}, {0xFF, EIO}}) {
    tree.controllerLink.delayRefusal = static_cast<std::uint8_t>(code);
    EXPECT_EQ(setDelay(tree.delays(), 3), status);
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  }
  const auto told = tree.log.effects.size();
  tree.controllerLink.delayRefusal = 0xC1;
  EXPECT_EQ(delayOf(tree.delays()), std::nullopt);
  EXPECT_TRUE(tree.log.values.back().unsupported);
  EXPECT_EQ(tree.log.effects.size(), told) << "no failure: it cannot have one";
  EXPECT_EQ(setDelay(tree.delays(), 3), ENOSYS);
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("does not know this request"));
  tree.controllerLink.delayRefusal = TreeController::tooLate;
  EXPECT_EQ(setDelay(tree.delays(), 7), 0);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << "it has come about all the same";
  tree.makeUnreadable("/etc/tavisk/startup-delay.conf");
  EXPECT_EQ(setDelay(tree.delays(), 3), ELOOP);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  tree.makeUnreadable("/sys/class/ipmi");
  EXPECT_EQ(setDelay(tree.delays(), 3), ENODEV);
  EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links"));
  EXPECT_EQ(tree.delays().numberProperty(std::nullopt, "ServerID"), std::nullopt);
  EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links"));
  tree.log.effects.clear();
  tree.makeUnreadable("/sys/class");
  EXPECT_EQ(tree.delays().masterPort(), ELOOP);
  tree.remove("/sys/class");
  EXPECT_EQ(tree.delays().masterPort(), ENODEV);
  EXPECT_TRUE(tree.log.effects.empty()) << "told by what follows, once";
}

TEST_F(PowerTest, ControllerOfAnotherMakerTakesTheAdministratorsRequestsAndNoGuess) {
  constexpr const char* file = "/etc/tavisk/startup-delay.conf";
  tree.controllerLink.maker = 0x58;
  EXPECT_EQ(setDelay(tree.delays(), 3), ENOSYS);
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("manufacturer 344"));
  const auto told = tree.log.effects.size();
  EXPECT_EQ(delayOf(tree.delays()), std::nullopt);
  EXPECT_TRUE(tree.log.values.back().unsupported);
  EXPECT_EQ(tree.log.effects.size(), told) << "no failure: it cannot have one";
  tree.write(file, "# rack 7\nmanufacturer=344 netfn=0x30 set=0x54 width=2 order=little unit=10\n");
  EXPECT_EQ(setDelay(tree.delays(), 100), 0);
  EXPECT_EQ(tree.controllerLink.delay, (std::vector<std::uint8_t>{0x2C, 0x01}));
  EXPECT_EQ(tree.lastEffect().where, "the management controller, /var/lib/tavisk/startup-delay");
  EXPECT_EQ(delayOf(tree.delays()), 100) << "a wish, as this controller does not tell";
  for (const auto* line : {"manufacturer=344 netfn=0x30 set=0x54 width=1 order=little unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=little unit=7"}) {
    tree.write(file, line);
    EXPECT_EQ(setDelay(tree.delays(), 100), EINVAL) << line;
  }
  for (const auto* line : {"manufacturer=344 netfn=0x30 set=0x154 width=2 order=big unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=5 order=big unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 unit=1",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=big unit=0",
                           "manufacturer=344 netfn=0x30 set=0x54 width=2 order=big unit=1 more=1"}) {
    tree.write(file, line);
    EXPECT_EQ(setDelay(tree.delays(), 100), ENOSYS) << line;
    EXPECT_THAT(tree.lastEffect(), FailedFor("not understood")) << line;
  }
}

}  // namespace
}  // namespace tavisk
