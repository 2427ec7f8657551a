// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <variant>

#include "hosts/linux/power/PowerTree.h"

namespace tavisk {
namespace {

/// What a change of a setting looks at, and whether that also tells if the machine can have the setting.
struct Look {
  const char* path;
  std::variant<SleepTimer, PowerSwitch, bool> setting;  ///< a bool: whether it restarts after a freeze
  bool tellsSupport = false;
};

struct Change {
  PowerTree& tree;
  Effect operator()(SleepTimer timer) const { return tree.set(timer, {20}); }
  Effect operator()(PowerSwitch which) const { return tree.turn(which, true); }
  Effect operator()(bool restarts) const { return tree.setRestartsAfterFreeze(restarts); }
};

constexpr auto modem = PowerSwitch::wakeOnModem;
constexpr auto network = PowerSwitch::wakeOnNetworkAccess;
constexpr auto button = PowerSwitch::powerButtonSleep;
constexpr auto firmware = PowerSwitch::restartAfterPowerFailure;

const Look looks[] = {
    {"/run/dbus/system_bus_socket", SleepTimer::computer},
    {"/etc/systemd/logind.conf.d/70-later.conf", SleepTimer::computer},
    {"/dev/tty1", SleepTimer::display},
    {"/sys/block", SleepTimer::hardDisk},
    {"/sys/devices/pci0000:00/0000:00:1f.2/sda-port/0:0:0:0/scsi_disk", SleepTimer::hardDisk},
    {"/sys/devices/pci0000:00/0000:00:1f.2/sda-port/0:0:0:0/block/sda/queue/rotational", SleepTimer::hardDisk},
    {"/etc/sysctl.d/70-later.conf", true},
    {"/dev/watchdog0", true},
    {"/sys/class/watchdog/watchdog0/nowayout", false},
    {"/run/udev/data/n2", network},
    {"/sys/class/net", network, true},
    {"/sys/devices/pci0000:00/eth0-slot/power/wakeup", network, true},
    {"/sys/class/tty", modem, true},
    {"/sys/devices/pnp0/00:04/power/wakeup", modem, true},
    {"/sys/bus/acpi/devices", button, true},
    {"/run/dbus/system_bus_socket", button, true},
    {"/sys/class/firmware-attributes", firmware, true},
    {"/sys/class/firmware-attributes/maker/attributes/AcPwrRcvry/possible_values", firmware, true},
    {"/etc/tavisk/firmware-attributes.conf", firmware, true},
};

TEST(PowerFaults, WhatCannotBeLookedAtIsAFailure) {
  for (const auto& [path, setting, tellsSupport] : looks) {
    PowerTree tree;
    if (setting == Look{"", false}.setting) tree.setRestartsAfterFreeze(true);
    if (setting == Look{"", firmware}.setting) tree.controllerLink.error = ENODEV;
    tree.write("/sys/class/firmware-attributes/maker/attributes/Other/possible_values", "On;Off\n");
    tree.loop(path);
    const auto before = tree.log.effects.size();
    std::visit(Change{tree}, setting);
    if (tellsSupport) {
      EXPECT_FALSE(tree.power().supports(std::get<PowerSwitch>(setting), tree.mains)) << path;
      EXPECT_FALSE(tree.power().canSet(std::get<PowerSwitch>(setting), tree.mains)) << path;
    }
    EXPECT_EQ(tree.log.effects.size(), before + (tellsSupport ? 3 : 1)) << path;
    for (auto i = before; i < tree.log.effects.size(); ++i) {
      EXPECT_EQ(tree.log.effects[i].outcome, Outcome::failed) << path;
      EXPECT_EQ(tree.log.effects[i].failure.value_or(Failure()).code, std::errc::too_many_symbolic_link_levels) << path;
    }
  }
}

TEST(PowerFaults, OwnFilesThatCannotBeReadStayAsTheyAre) {
  PowerTree tree;
  const std::string tooLong((std::size_t{1} << 20U) + 1, '#');
  const Look files[] = {{"/etc/systemd/logind.conf.d/60-tavisk.conf", SleepTimer::computer},
                        {"/etc/tmpfiles.d/60-tavisk.conf", SleepTimer::display},
                        {"/etc/udev/rules.d/60-tavisk-disk-sleep.rules", SleepTimer::hardDisk},
                        {"/etc/udev/rules.d/60-tavisk-wake-on-ring.rules", modem},
                        {"/etc/systemd/network/99-default.link.d/60-tavisk.conf", network},
                        {"/etc/sysctl.d/60-tavisk.conf", true}};
  for (const auto& [path, setting, tellsSupport] : files) {
    tree.write(path, tooLong);
    EXPECT_EQ(std::visit(Change{tree}, setting).outcome, Outcome::failed) << path;
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

TEST(PowerFaults, HardDiskSleepLeavesOutADiskThatGoesAway) {
  PowerTree tree;
  tree.addDisk("sdb");
  tree.remove("/sys/block/sdb/device/power/control");
  const auto effect = tree.set(SleepTimer::hardDisk, {10});
  EXPECT_EQ(effect.outcome, Outcome::applied);
  EXPECT_EQ(effect.before, "0");
}

}  // namespace
}  // namespace tavisk
