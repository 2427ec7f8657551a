// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectMatchers.h"
#include "hosts/linux/power/PowerTree.h"

namespace tavisk {
namespace {

using testing::HasSubstr;

/// Others have a say in the same settings.
struct PowerConflicts : testing::Test {
  PowerTree tree;
};

constexpr const char* loginFile = "/etc/systemd/logind.conf.d/60-tavisk.conf";

/// Another file hides what a set writes, after ours has another value already.
struct Hidden {
  const char* what;
  std::function<Effect(PowerTree&)> setFirst;
  const char* file;
  const char* text;
  std::function<Effect(PowerTree&)> set;
  const char* ours;  ///< its file
  std::function<Effect(PowerTree&)> setAsHidden;
  const char* waits;  ///< in ours, until the last set
};
const Hidden hidden[] = {
    {"computer sleep", [](auto& tree) { return tree.set(SleepTimer::computer, {20}); },
     "/etc/systemd/logind.conf.d/70-other.conf", "[Login]\nIdleAction=ignore\n",
     [](auto& tree) { return tree.set(SleepTimer::computer, {30}); }, loginFile,
     [](auto& tree) { return tree.set(SleepTimer::computer, {}); }, "0, while 20 waits in "},
    {"power button", [](auto& tree) { return tree.turn(PowerSwitch::powerButtonSleep, true); },
     "/run/systemd/logind.conf.d/70-other.conf", "[Login]\nHandlePowerKey=poweroff\nIdleAction=ignore\n",
     [](auto& tree) { return tree.turn(PowerSwitch::powerButtonSleep, true); }, loginFile,
     [](auto& tree) { return tree.turn(PowerSwitch::powerButtonSleep, false); }, "off, while on waits in "},
    {"display sleep", [](auto& tree) { return tree.set(SleepTimer::display, {20}); },
     "/usr/lib/tmpfiles.d/50-other.conf", "w! /dev/tty1 - - - - \\033[9;5]\n",
     [](auto& tree) { return tree.set(SleepTimer::display, {30}); }, "/etc/tmpfiles.d/60-tavisk.conf",
     [](auto& tree) { return tree.set(SleepTimer::display, {5}); }, "5, while 20 waits in "},
    {"network access", [](auto& tree) { return tree.turn(PowerSwitch::wakeOnNetworkAccess, true); },
     "/usr/lib/systemd/network/99-default.link.d/70-other.conf", "[Link]\nWakeOnLan=off\n",
     [](auto& tree) { return tree.turn(PowerSwitch::wakeOnNetworkAccess, true); },
     "/etc/systemd/network/99-default.link.d/60-tavisk.conf",
     [](auto& tree) { return tree.turn(PowerSwitch::wakeOnNetworkAccess, false); }, "off, while on waits in "},
    {"freeze, kernel", [](auto& tree) { return tree.setRestartsAfterFreeze(true); }, "/etc/sysctl.d/99-sysctl.conf",
     "# kernel.panic=10\n-kernel/panic = 0\n", [](auto& tree) { return tree.setRestartsAfterFreeze(true); },
     "/etc/sysctl.d/60-tavisk.conf", [](auto& tree) { return tree.setRestartsAfterFreeze(false); },
     "on by the watchdog only, while on waits in "},
    {"freeze, watchdog", [](auto& tree) { return tree.setRestartsAfterFreeze(true); },
     "/etc/systemd/system.conf.d/70-other.conf", "[Manager]\nRuntimeWatchdogSec=off\n",
     [](auto& tree) { return tree.setRestartsAfterFreeze(true); }, "/etc/systemd/system.conf.d/60-tavisk.conf",
     [](auto& tree) { return tree.setRestartsAfterFreeze(false); }, "on after a kernel panic only, while on waits in "},
};

TEST(PowerConflictsOfFiles, WhatAnotherFileHidesIsNotLeftInOursAndOffTakesItOut) {
  for (const auto& each : hidden) {
    SCOPED_TRACE(each.what);
    PowerTree tree;
    const auto foretold = tree.foretell(each.setFirst);
    EXPECT_FALSE(std::filesystem::exists(tree.at(each.ours)));
    const auto first = each.setFirst(tree);
    EXPECT_EQ(first.outcome, Outcome::applied);
    EXPECT_EQ(std::pair(foretold.live, foretold.stored), std::pair(first.live, first.stored));
    const auto before = tree.file(each.ours);
    tree.write(each.file, each.text);
    EXPECT_THAT(tree.foretell(each.set), FailedFor(std::string(each.file) + " says otherwise"));
    const auto refused = each.set(tree);
    EXPECT_THAT(refused, FailedFor(std::string(each.file) + " says otherwise"));
    EXPECT_EQ(refused.undoneBy, each.file);
    EXPECT_EQ(refused.where, "");
    EXPECT_FALSE(refused.changed);
    EXPECT_EQ(refused.stored, each.waits + std::string(each.ours));
    EXPECT_EQ(tree.file(each.ours), before);

    tree.write("/sys/module/kernel/parameters/consoleblank", "300\n");
    const auto off = each.setAsHidden(tree);
    EXPECT_EQ(off.outcome, Outcome::applied) << toJson(off);
    EXPECT_THAT(off.where, HasSubstr(each.ours));
    EXPECT_TRUE(off.changed);
    tree.remove(each.file);
    EXPECT_EQ(each.setAsHidden(tree).outcome, Outcome::unchanged) << "nothing of ours was left to come back";
  }
}

TEST_F(PowerConflicts, ServiceThatAnotherRunRestartsIsAskedAgain) {
  tree.bus.answersMissing = 3;
  EXPECT_TRUE(tree.power().canSet(PowerSwitch::powerButtonSleep, tree.mains));
  EXPECT_EQ(tree.turn(PowerSwitch::powerButtonSleep, true).outcome, Outcome::applied);
  tree.bus.answersMissing = 2;
  EXPECT_EQ(tree.set(SleepTimer::computer, {20}).outcome, Outcome::applied);
  tree.bus.answersMissing = 2;
  tree.bus.canSuspend = nullptr;
  EXPECT_THAT(tree.set(SleepTimer::computer, {30}), FailedFor("it is out of order"));
}

TEST_F(PowerConflicts, FileWithTheLastWordIsNamedUnlessItSaysTheSame) {
  constexpr const char* last = "/etc/systemd/logind.conf.d/70-other.conf";
  tree.write("/etc/systemd/logind.conf.d/65-other.conf",
             "[Login]\nIdleAction=ignore\nIdleActionSec=5min\nHandlePowerKey=ignore\n");
  tree.write(last, "[Login]\nIdleAction=suspend\nIdleActionSec=20min\nHandlePowerKey=suspend\n");
  EXPECT_EQ(tree.set(SleepTimer::computer, {20}).undoneBy, "nightly-backup");
  EXPECT_EQ(tree.set(SleepTimer::computer, {30}).undoneBy, last);
  EXPECT_EQ(tree.set(SleepTimer::computer, {}).undoneBy, last);
  EXPECT_EQ(tree.turn(PowerSwitch::powerButtonSleep, true).undoneBy, "");
  EXPECT_EQ(tree.turn(PowerSwitch::powerButtonSleep, false).undoneBy, last);
  tree.write(last, "[Login]\nIdleAction=ignore\nIdleActionSec=20min\n");
  EXPECT_EQ(tree.set(SleepTimer::computer, {}).undoneBy, "") << "it never sleeps, whatever the time";
}

TEST_F(PowerConflicts, OwnFileIsAPlaceThatWasWrittenWhateverItsChangeCameTo) {
  const OwnFile file(tree.machine.root, loginFile);
  for (const bool writes : {false, true}) {
    Setting<bool> setting;
    setting.name = "Any";
    keepIn(file, setting, [&](bool) -> Result<void> {
      if (writes) tree.write(loginFile, "half");
      return Failure{"put back", loginFile, "disk full"};
    });
    EXPECT_EQ(carryOut(setting, true, tree.machine).where, writes ? loginFile : "");
  }
}

TEST_F(PowerConflicts, RulesThatSomebodyChangesOrOverrulesAreSeen) {
  const auto ours = tree.set(SleepTimer::hardDisk, {10}).where;
  constexpr const char* later = "/usr/lib/udev/rules.d/70-disks.rules";
  tree.write(ours, tree.file(ours) + "ACTION==\"add\", SUBSYSTEM==\"block\", ATTR{device/power/control}=\"on\"\n");
  tree.write(later, "SUBSYSTEM==\"block\", ATTR{device/power/control}==\"on\", GOTO=\"end\"\n");
  const auto again = tree.set(SleepTimer::hardDisk, {10});
  EXPECT_EQ(again.outcome, Outcome::applied) << "it does not say what it said";
  EXPECT_EQ(again.undoneBy, "");
  tree.write(later, "SUBSYSTEM==\"block\", ATTR{device/power/control}=\"on\"\n");
  EXPECT_EQ(tree.set(SleepTimer::hardDisk, {20}).undoneBy, later);
}

TEST_F(PowerConflicts, RestartAfterFreezeLeavesTheAdministratorsOwnKernelPanic) {
  constexpr const char* theirs = "/etc/sysctl.d/50-admin.conf";
  constexpr const char* ours = "/etc/sysctl.d/60-tavisk.conf";
  tree.write(theirs, "kernel.panic = 5\n");
  tree.write("/proc/sys/kernel/panic", "5\n");
  const auto on = tree.setRestartsAfterFreeze(true);
  EXPECT_EQ(on.outcome, Outcome::applied);
  EXPECT_EQ(on.where, "/etc/systemd/system.conf.d/60-tavisk.conf");
  EXPECT_FALSE(tree.has(ours));
  EXPECT_EQ(tree.file("/proc/sys/kernel/panic"), "5\n");

  const auto off = tree.setRestartsAfterFreeze(false);
  EXPECT_THAT(off, FailedFor("reads on after a kernel panic only"));
  EXPECT_TRUE(off.changed) << "the watchdog is off";
  EXPECT_EQ(off.undoneBy, theirs);
  tree.remove(theirs);
  EXPECT_EQ(tree.setRestartsAfterFreeze(false).live, "off");
  tree.setRestartsAfterFreeze(true);
  EXPECT_THAT(tree.file(ours), HasSubstr("kernel.panic = 10\n"));
  tree.setRestartsAfterFreeze(false);
  EXPECT_FALSE(tree.has(ours));
  tree.write("/proc/cmdline", "panic=-1\n");
  EXPECT_EQ(tree.setRestartsAfterFreeze(true).where, "/etc/systemd/system.conf.d/60-tavisk.conf");
}

}  // namespace
}  // namespace tavisk
