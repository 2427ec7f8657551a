// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ScratchMachine.h"
#include "effects/SettingNames.h"
#include "hosts/scratch/MachineSettings.h"

namespace tavisk {
namespace {

using testing::AllOf;
using testing::HasSubstr;

/// An operation that sets or reads a setting, and what it leaves in the file.
struct Operation {
  const char* setting;
  void (*carryOut)(Host& host);
};

const PowerSource source{"AC Power"};

constexpr Operation sets[] = {
    {setting::time, [](Host& host) { host.clock().setTime(1); }},
    {setting::timeZone, [](Host& host) { host.clock().setTimeZone({"Asia/Tokyo"}); }},
    {setting::networkTime, [](Host& host) { host.networkTime().start(); }},
    {setting::networkTime, [](Host& host) { host.networkTime().stop(); }},
    {setting::networkTimeAtStartup, [](Host& host) { host.networkTime().setLaunchAtStartup(true); }},
    {setting::networkTimeServer, [](Host& host) { host.networkTime().setServer({"time.example"}); }},
    {setting::networkTimeRestart, [](Host& host) { host.networkTime().restartAsynchronously(); }},
    {setting::computerSleep, [](Host& host) { host.powerSettings().setUntilSleep(SleepTimer::computer, source, {1}); }},
    {setting::displaySleep, [](Host& host) { host.powerSettings().setUntilSleep(SleepTimer::display, source, {1}); }},
    {setting::hardDiskSleep, [](Host& host) { host.powerSettings().setUntilSleep(SleepTimer::hardDisk, source, {1}); }},
    {setting::wakeOnModem, [](Host& host) { host.powerSettings().setOn(PowerSwitch::wakeOnModem, source, true); }},
    {setting::restartAfterFreeze, [](Host& host) { host.powerSettings().setRestartsAfterFreeze(false); }},
    {setting::remoteLogin, [](Host& host) { host.remoteShell().setEnabled(false); }},
    {setting::remoteEvents, [](Host& host) { host.remoteEvents().setEnabled(false); }},
    {setting::computerName, [](Host& host) { host.hostConfiguration().setComputerName("new"); }},
    {setting::localSubnetName, [](Host& host) { host.hostConfiguration().setLocalNetworkName("new"); }},
    {setting::keyboardLock, [](Host& host) { host.processes().setLockEnclosureState(true); }},
    {setting::keyboardLockPreference, [](Host& host) { host.processes().setMachineBoolean("key", false); }},
};

constexpr Operation reads[] = {
    {setting::authorization, [](Host& host) { EXPECT_FALSE(host.authenticator().isAuthenticated()); }},
    {setting::time, [](Host& host) { EXPECT_GT(host.clock().now(), 1'000'000); }},
    {setting::timeZone, [](Host& host) { EXPECT_EQ(host.clock().timeZone(), utc()); }},
    {setting::knownTimeZones, [](Host& host) { EXPECT_TRUE(host.clock().knownTimeZones().empty()); }},
    {setting::networkTime, [](Host& host) { EXPECT_FALSE(host.networkTime().isRunning()); }},
    {setting::networkTimeServer, [](Host& host) { EXPECT_EQ(host.networkTime().server().address, ""); }},
    {setting::computerSleep,
     [](Host& host) { EXPECT_EQ(host.powerSettings().untilSleep(SleepTimer::computer, source).count, 0U); }},
    {setting::wakeOnModem,
     [](Host& host) { EXPECT_FALSE(host.powerSettings().isOn(PowerSwitch::wakeOnModem, source)); }},
    {setting::restartAfterFreeze, [](Host& host) { EXPECT_FALSE(host.powerSettings().restartsAfterFreeze()); }},
    {setting::remoteLogin, [](Host& host) { EXPECT_FALSE(host.remoteShell().isEnabled()); }},
    {setting::remoteEvents, [](Host& host) { EXPECT_FALSE(host.remoteEvents().isEnabled()); }},
    {setting::computerName, [](Host& host) { EXPECT_FALSE(host.dynamicStore().open("test")->computerName()); }},
    {setting::keyboardLockPreference, [](Host& host) { EXPECT_FALSE(host.preferences().value("key")); }},
};

/// A machine whose every value differs from what its key reads as when absent.
class RefusalsTest : public testing::Test {
 protected:
  void SetUp() override {
    machine.set("Authorization", "Authenticated", true);
    machine.set("Clock", "Time", 5);
    machine.set("Clock", "Time Zone", "Europe/Paris");
    machine.set("Network Time", "Running", true);
    machine.set("Network Time", "Server", "old.example");
    machine.set("Power Sources", "AC Power", acPower());
    machine.set("Power", "Restart On Hang", true);
    machine.set("Remote Shell", "Enabled", true);
    machine.set("Remote Events", "Enabled", true);
    machine.set("Dynamic Store", "Computer Name", "old");
    machine.set("Preferences", "key", true);
  }
  static PropertyList::Dictionary acPower() {
    PropertyList::Dictionary settings;
    settings.set("System Sleep", 5);
    settings.set("Wake On Ring", true);
    return settings;
  }
  void expectRefused(const Operation& operation, const char* reason) {
    auto before = machine.description();
    auto effects = machine.effectsLog().size();
    operation.carryOut(machine.host());
    EXPECT_EQ(machine.description(), before) << operation.setting;
    ASSERT_EQ(machine.effectsLog().size(), effects + 1) << operation.setting;
    auto failed = std::string(R"({"setting":")") + operation.setting + R"(","outcome":"failed")";
    EXPECT_THAT(machine.effectsLog().back(), AllOf(HasSubstr(failed), HasSubstr(reason)));
  }
  void expectDone(const Operation& operation) {
    auto before = machine.description();
    operation.carryOut(machine.host());
    EXPECT_NE(machine.description(), before) << operation.setting;
  }

  ScratchMachine machine;
};

TEST_F(RefusalsTest, aRefusedSetChangesNothingAndSaysWhy) {
  for (const auto& set : sets) {
    machine.refuse(set.setting, "the panel is locked");
    expectRefused(set, "the panel is locked");
    machine.set("Refusals", set.setting, "");
    expectRefused(set, "");
  }
  EXPECT_EQ(machine.host().clock().timeZone(), ZoneName{"Europe/Paris"}) << "reading goes on";
}

TEST_F(RefusalsTest, aRefusedReadFailsAndSaysWhy) {
  for (const auto& read : reads) {
    machine.refuse(std::string(read.setting) + " (read)", "out of order");
    expectRefused(read, "out of order");
  }
}

TEST_F(RefusalsTest, theStarIsEverySetOrEveryReadThatHasNoReasonOfItsOwn) {
  machine.refuse("*", "maintenance");
  machine.refuse(setting::time, "no clock");
  for (const auto& set : sets) expectRefused(set, set.setting == setting::time ? "no clock" : "maintenance");
  machine.set("Refusals", "* (read)", "blind");
  for (const auto& read : reads) expectRefused(read, "blind");
}

TEST_F(RefusalsTest, aSetThatCannotBeReadBackIsDoneAndFailed) {
  machine.refuse("* (read)", "blind");
  for (const auto& set : sets) {
    if (set.setting == setting::networkTimeRestart) continue;
    set.carryOut(machine.host());
    EXPECT_THAT(machine.effectsLog().back(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("blind")));
  }
  EXPECT_EQ(machine.get("Clock", "Time Zone"), PropertyList("Asia/Tokyo"));
}

TEST_F(RefusalsTest, theAuthorizationIsRefusedByItsNameOnly) {
  machine.refuse("*", "maintenance");
  machine.host().authenticator().deauthenticate();
  EXPECT_EQ(machine.get("Authorization", "Authenticated"), PropertyList(false));
  EXPECT_TRUE(machine.effectsLog().empty());
  machine.refuse(setting::authorization, "not you");
  expectRefused({setting::authorization, [](Host& host) { host.authenticator().authenticate(); }}, "not you");
}

TEST_F(RefusalsTest, nothingElseIsRefused) {
  machine.refuse("Time Zon", "another setting");
  machine.refuse("time", "another setting");
  for (const auto& set : sets) set.carryOut(machine.host());
  EXPECT_THAT(machine.effectsLog(), testing::Each(testing::Not(HasSubstr("failed"))));
}

}  // namespace
}  // namespace tavisk
