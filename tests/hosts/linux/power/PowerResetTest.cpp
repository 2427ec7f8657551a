// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <functional>
#include <set>

#include "effects/EffectMatchers.h"
#include "hosts/linux/power/PowerTree.h"

namespace tavisk {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char* loginDropIn = "/etc/systemd/logind.conf.d/60-tavisk.conf";
constexpr const char* panicSeconds = "/proc/sys/kernel/panic";

/// A setting, as it is set and reset.
struct Reset {
  const char* name;
  std::function<Effect(PowerTree& tree)> set;
  std::function<void(LinuxPowerSettingsService& power)> reset;
  const char* live;  ///< after the reset of a machine that nobody else has configured
};

std::vector<Reset> resets() {
  std::vector<Reset> all;
  for (const auto timer : {SleepTimer::computer, SleepTimer::display, SleepTimer::hardDisk})
    all.push_back({nameOf(timer), [=](PowerTree& tree) { return tree.set(timer, {20}); },
                   [=](LinuxPowerSettingsService& power) { power.reset(timer); }, "0"});
  for (const auto& [which, live] : {std::pair(PowerSwitch::wakeOnModem, "off"),
                                    {PowerSwitch::wakeOnNetworkAccess, "on"},
                                    {PowerSwitch::powerButtonSleep, "off"}})
    all.push_back({nameOf(which), [which = which](PowerTree& tree) { return tree.turn(which, true); },
                   [which = which](LinuxPowerSettingsService& power) { power.reset(which); }, live});
  for (const bool restarts : {true, false})
    all.push_back({"Restart After Freeze",
                   [=](PowerTree& tree) {
                     tree.setRestartsAfterFreeze(!restarts);
                     return tree.setRestartsAfterFreeze(restarts);
                   },
                   [](LinuxPowerSettingsService& power) { power.resetRestartAfterFreeze(); }, "off"});
  return all;
}

std::set<std::string> filesOf(const PowerTree& tree) {
  std::set<std::string> files;
  for (const auto& entry : std::filesystem::recursive_directory_iterator(tree.at("/etc")))
    if (!std::filesystem::is_directory(entry.symlink_status())) files.insert(entry.path());
  return files;
}

TEST(PowerReset, TakesTheOwnFilesAwayAndPutsIntoForceWhatIsLeft) {
  for (const auto& each : resets()) {
    PowerTree tree;
    const auto set = each.set(tree);
    EXPECT_THAT(filesOf(tree), Not(IsEmpty())) << each.name;
    each.reset(tree.power());
    const auto effect = tree.lastEffect();
    EXPECT_EQ(effect.setting, each.name);
    EXPECT_EQ(effect.outcome, Outcome::applied) << toJson(effect);
    EXPECT_EQ(effect.before, set.live) << each.name;
    EXPECT_EQ(effect.live, each.live) << each.name;
    EXPECT_TRUE(effect.changed) << each.name;
    EXPECT_FALSE(effect.where.empty()) << each.name;
    EXPECT_THAT(filesOf(tree), IsEmpty()) << each.name;
    const bool staysInForce = each.name == std::string("Wake On Network Access");
    EXPECT_EQ(effect.note.empty(), !staysInForce) << each.name << ": what the driver would do is not known";
    each.reset(tree.power());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::unchanged) << each.name;
    EXPECT_EQ(tree.lastEffect().note, "tavisk stores nothing of it") << each.name;
  }
}

TEST(PowerReset, EndsWhatWasCutShort) {
  for (const auto& each : resets()) {
    PowerTree tree;
    const auto mark = std::string("/run/tavisk/resets/") + each.name;
    each.set(tree);
    tree.write(mark, "");
    for (const auto& file : filesOf(tree)) std::filesystem::remove(file);
    each.reset(tree.foreteller());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << each.name;
    EXPECT_TRUE(tree.has(mark)) << each.name;
    each.reset(tree.power());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << each.name;
    EXPECT_EQ(tree.lastEffect().live, each.live) << each.name;
    EXPECT_FALSE(tree.has(mark)) << each.name;
    each.reset(tree.power());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::unchanged) << each.name;
  }
}

TEST(PowerReset, EndsWhatHasFailedAfterTheFileWasGone) {
  constexpr const char* control = "/sys/block/sda/device/power/control";
  PowerTree tree;
  tree.set(SleepTimer::hardDisk, {20});
  tree.makeUnreadable(control);
  tree.power().reset(SleepTimer::hardDisk);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  EXPECT_THAT(filesOf(tree), IsEmpty());
  tree.remove(control);
  tree.write(control, "auto\n");
  tree.power().reset(SleepTimer::hardDisk);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << toJson(tree.lastEffect());
  EXPECT_EQ(tree.file(control), "on");
}

TEST(PowerReset, NeedsRootAndLeavesWhatItForetellsOrCannotLookAt) {
  for (const auto& each : resets()) {
    PowerTree tree;
    each.set(tree);
    const auto before = filesOf(tree);
    {
      const AsMember member(tree);
      each.reset(tree.power());
      EXPECT_THAT(tree.lastEffect(), FailedFor("root")) << each.name;
    }
    each.reset(tree.foreteller());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << each.name;
    EXPECT_EQ(filesOf(tree), before) << each.name;
    for (const auto& file : before) tree.makeUnreadable(file.substr(tree.at("/").string().size()));
    each.reset(tree.power());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed) << each.name;
    EXPECT_EQ(filesOf(tree), before) << each.name;
  }
}

TEST(PowerReset, LeavesTheOtherSettingInTheSharedFile) {
  PowerTree tree;
  tree.set(SleepTimer::computer, {20});
  tree.turn(PowerSwitch::powerButtonSleep, true);
  tree.power().reset(SleepTimer::computer);
  EXPECT_EQ(tree.lastEffect().where, loginDropIn);
  EXPECT_THAT(tree.file(loginDropIn), HasSubstr("[Login]\nHandlePowerKey=suspend\n"));
  EXPECT_THAT(tree.file(loginDropIn), Not(HasSubstr("Idle")));
  EXPECT_EQ(tree.bus.sleepsAfter(), "never");
  EXPECT_TRUE(tree.power().isOn(PowerSwitch::powerButtonSleep, tree.mains));
  tree.power().reset(PowerSwitch::powerButtonSleep);
  EXPECT_FALSE(tree.has(loginDropIn));
}

TEST(PowerReset, GoesBackToWhatOthersHaveConfigured) {
  PowerTree tree;
  tree.set(SleepTimer::computer, {20});
  tree.write("/etc/systemd/logind.conf.d/70-other.conf", "[Login]\nIdleAction=suspend\nIdleActionSec=5min\n");
  tree.power().reset(SleepTimer::computer);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.bus.sleepsAfter(), "5min");

  tree.set(SleepTimer::display, {20});
  tree.write("/proc/cmdline", "quiet consoleblank=600\n");
  tree.power().reset(SleepTimer::display);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.lastEffect().live, "10");

  tree.turn(PowerSwitch::wakeOnNetworkAccess, true);
  tree.write("/etc/systemd/network/99-default.link.d/70-other.conf", "[Link]\nWakeOnLan=off\n");
  tree.power().reset(PowerSwitch::wakeOnNetworkAccess);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.cards.cards["eth0"].modes.enabled, 0U);

  tree.setRestartsAfterFreeze(true);
  tree.write("/etc/sysctl.d/10-other.conf", "kernel.panic = 30\n");
  tree.power().resetRestartAfterFreeze();
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.lastEffect().live, "on after a kernel panic only");
  EXPECT_EQ(tree.lastEffect().stored, "on after a kernel panic only");
  EXPECT_EQ(tree.file(panicSeconds), "30");
  EXPECT_TRUE(tree.has("/etc/sysctl.d/10-other.conf"));
}

TEST(PowerReset, TakesAwayWhatAMachineCannotHaveAnyMore) {
  PowerTree tree;
  tree.set(SleepTimer::hardDisk, {20});
  tree.remove("/sys/block/sda");
  tree.power().reset(SleepTimer::hardDisk);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_THAT(tree.lastEffect().note, HasSubstr("no built-in disk here"));
  EXPECT_THAT(filesOf(tree), IsEmpty());

  // Beside a link file by which no card is set up any more, and where no device manager would read it.
  tree.turn(PowerSwitch::wakeOnNetworkAccess, true);
  tree.write("/etc/systemd/network/10-old.link.d/60-tavisk.conf", "[Link]\nWakeOnLan=magic\n");
  tree.remove("/run/udev/control");
  tree.power().reset(PowerSwitch::wakeOnNetworkAccess);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_THAT(filesOf(tree), IsEmpty());
}

/// Both files, or none.
TEST(PowerReset, PutsTheOneFileBackWhereTheOtherStays) {
  PowerTree tree;
  tree.setRestartsAfterFreeze(true);
  const auto before = filesOf(tree);
  tree.makeUnreadable("/etc/systemd/system.conf.d/60-tavisk.conf");
  tree.power().resetRestartAfterFreeze();
  EXPECT_THAT(tree.lastEffect(), FailedFor("60-tavisk.conf"));
  EXPECT_EQ(tree.lastEffect().where, "");
  EXPECT_EQ(filesOf(tree), before);
}

}  // namespace
}  // namespace tavisk
