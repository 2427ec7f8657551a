// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ScratchMachine.h"
#include "base/Keys.h"
#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/scratch/MachineSettings.h"

namespace tavisk {
namespace {

/// An operation that sets or reads a setting.
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
    {setting::wakeOnModem, [](Host& host) { host.powerSettings().setOn(PowerSwitch::wakeOnModem, source, true); }},
    {setting::restartAfterFreeze, [](Host& host) { host.powerSettings().setRestartsAfterFreeze(false); }},
    {setting::computerName, [](Host& host) { host.hostConfiguration().setComputerName("new"); }},
    {setting::keyboardLockPreference, [](Host& host) { host.processes().setMachineBoolean("key", false); }},
};

constexpr Operation reads[] = {
    {setting::authorization, [](Host& host) { EXPECT_FALSE(host.authenticator().isAuthenticated()); }},
    {setting::time, [](Host& host) { EXPECT_GT(host.clock().now(), 1'000'000); }},
    {setting::timeZone, [](Host& host) { EXPECT_EQ(host.clock().timeZone(), utc()); }},
    {setting::knownTimeZones, [](Host& host) { EXPECT_TRUE(host.clock().knownTimeZones().empty()); }},
    {setting::networkTime, [](Host& host) { EXPECT_FALSE(host.networkTime().isRunning()); }},
    {setting::computerSleep,
     [](Host& host) { EXPECT_EQ(host.powerSettings().untilSleep(SleepTimer::computer, source).count, 0U); }},
    {setting::wakeOnModem,
     [](Host& host) { EXPECT_FALSE(host.powerSettings().isOn(PowerSwitch::wakeOnModem, source)); }},
    {setting::restartAfterFreeze, [](Host& host) { EXPECT_FALSE(host.powerSettings().restartsAfterFreeze()); }},
    {setting::remoteLogin, [](Host& host) { EXPECT_FALSE(host.remoteShell().isEnabled()); }},
    {setting::startupDisk, [](Host& host) { EXPECT_FALSE(host.diskManagement().bootPreference().disk); }},
    {setting::remoteEvents, [](Host& host) { EXPECT_FALSE(host.remoteEvents().isEnabled()); }},
    {setting::keyboardLockPreference, [](Host& host) { EXPECT_FALSE(host.preferences().value("key")); }},
};

/// A machine whose every value differs from what its key reads as when absent.
class RefusingMachine : public ScratchMachine {
 public:
  RefusingMachine() {
    set("Authorization", "Authenticated", true);
    set("Clock", "Time", 5);
    set("Clock", "Time Zone", "Europe/Paris");
    set("Network Time", "Running", true);
    set("Network Time", "Server", "old.example");
    set("Power Sources", source.name, keys({{"System Sleep", 5}, {"Wake On Ring", true}}));
    set("Power", "Restart On Hang", true);
    set("Remote Shell", "Enabled", true);
    set("Remote Events", "Enabled", true);
    set("Dynamic Store", "Computer Name", "old");
    set("Preferences", "key", true);
    set("Firmware", "Boot Preference", keys({{"Disk", "disk0s2"}}));
  }

  /// That the operation changes nothing, and that this is all that is told.
  void expectRefused(const Operation& operation, const char* tried, const char* reason) {
    SCOPED_TRACE(operation.setting);
    const auto before = description();
    operation.carryOut(host());
    EXPECT_EQ(description(), before);
    ASSERT_EQ(log.effects.size(), 1U);
    EXPECT_EQ(log.effects[0].setting, operation.setting);
    EXPECT_EQ(log.effects[0].outcome, Outcome::failed);
    EXPECT_EQ(log.effects[0].failure, (Failure{tried, "the rehearsed machine", reason}));
  }
};

TEST(Refusals, ofASetChangeNothingAndSayWhy) {
  for (const auto& set : sets) {
    for (const auto& [name, reason] : {std::pair(set.setting, "the panel is locked"), {set.setting, ""}, {"*", "no"}}) {
      RefusingMachine machine;
      machine.refuse(name, reason);
      machine.expectRefused(set, "set", reason);
    }
  }
}

TEST(Refusals, ofAReadFailAndSayWhy) {
  for (const auto& read : reads) {
    for (const auto* name : {read.setting, "*"}) {
      RefusingMachine machine;
      machine.refuse(name + std::string(" (read)"), "out of order");
      machine.expectRefused(read, "read", "out of order");
    }
  }
}

TEST(Refusals, byNameComeBeforeTheStarAndAreNotOfReads) {
  RefusingMachine machine;
  machine.refuse("*", "maintenance");
  machine.refuse(setting::time, "no clock");
  machine.expectRefused(sets[0], "set", "no clock");
  EXPECT_EQ(machine.host().clock().timeZone(), ZoneName{"Europe/Paris"});
}

TEST(Refusals, ofReadsAndOfOtherNamesLetASetBeDone) {
  RefusingMachine machine;
  for (const char* name : {"* (read)", "Times", "ime", "time"}) machine.refuse(name, "blind");
  sets[0].carryOut(machine.host());
  EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(1));
  EXPECT_EQ(machine.log.effects.back().failure, (Failure{"read", "the rehearsed machine", "blind"}));
}

TEST(Refusals, tellAgainWhatAnotherMachineHasTold) {
  EXPECT_EQ(refusalTelling({"open", "/proc/a", "Permission denied"}), "open on /proc/a: Permission denied");
  RefusingMachine machine;
  machine.refuse(setting::time, "no clock");
  sets[0].carryOut(machine.host());
  machine.refuse(setting::time, refusalTelling(machine.log.effects.at(0).failure.value()));
  machine.log.effects.clear();
  machine.expectRefused(sets[0], "set", "no clock");
}

TEST(Refusals, ofTheAuthorizationAreByItsNameOnly) {
  RefusingMachine machine;
  machine.refuse("*", "maintenance");
  machine.host().authenticator().deauthenticate();
  EXPECT_EQ(machine.get("Authorization", "Authenticated"), PropertyList(false));
  EXPECT_TRUE(machine.log.effects.empty());
  machine.refuse(setting::authorization, "not you");
  machine.expectRefused({setting::authorization, [](Host& host) { host.authenticator().authenticate(); }}, "set",
                        "not you");
}

}  // namespace
}  // namespace tavisk
