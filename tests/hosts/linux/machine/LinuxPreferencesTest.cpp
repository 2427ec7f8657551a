// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <tuple>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/MachineLock.h"
#include "platform/PreferencesContract.h"

namespace tavisk {
namespace {

using testing::HasSubstr;

constexpr const char* preferencesFile = "/etc/tavisk/preferences/AnyApplication.plist";

struct LinuxPreferences {
  PreferencesStore& preferences() { return tree.host().preferences(); }
  ProcessUtilities& processes() { return tree.host().processes(); }
  void put(const PropertyList& value) {
    PropertyList::Dictionary all;
    all.set(DunmereLockEnclosureStateKey, value);
    tree.write(preferencesFile, *writePropertyList(all));
  }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, PreferencesContract, LinuxPreferences);

TEST(LinuxPreferences, AreWrittenTogetherWithThoseOfOtherRuns) {
  LinuxTree tree;
  auto& processes = tree.host().processes();
  processes.setMachineBoolean("a", true);
  tree.write(
      preferencesFile,
      "<plist><dict><key>other</key><date>2026-01-01T00:00:00Z</date><key>b</key><string>x</string></dict></plist>");
  processes.setMachineBoolean("b", false);
  processes.writeMachinePreferences();
  for (const char* part : {"<key>other</key>", "2026-01-01T00:00:00Z", "<key>a</key>", "<key>b</key>"})
    EXPECT_THAT(tree.file(preferencesFile), HasSubstr(part));
  EXPECT_EQ(tree.lastEffect().before, "string") << "another type is told as what it is";
  EXPECT_EQ(tree.lastEffect().stored, "off");
}

TEST(LinuxPreferences, AreNotWrittenWhileAnotherRunChangesTheMachine) {
  LinuxTree tree;
  auto& processes = tree.host().processes();
  processes.setLockEnclosureState(true);
  processes.setMachineBoolean("a", true);
  EXPECT_TRUE(tree.log.effects.empty()) << "the keyboards wait for their preference";
  tree.write(preferencesFile, "<dict/>");
  const auto held = MachineLock(tree.root, tree.runLoop).hold();
  const auto limit = tree.runLoop.limitWaits(std::chrono::milliseconds(10));
  processes.writeMachinePreferences();
  EXPECT_THAT(tree.log.effects, testing::SizeIs(2));
  EXPECT_THAT(tree.log.effects, testing::Each(FailedFor("is changing a setting of this machine")));
  EXPECT_EQ(tree.file(preferencesFile), "<dict/>");
}

TEST(LinuxPreferences, ReadAsNoneOutOfADamagedFileAndAreKeptBesideIt) {
  LinuxTree tree;
  tree.write(preferencesFile, "<dict>");
  EXPECT_FALSE(tree.host().preferences().value("a"));
  EXPECT_THAT(tree.lastEffect(), FailedFor(preferencesFile));
  tree.host().processes().setMachineBoolean("a", true);
  tree.host().processes().writeMachinePreferences();
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  const auto damaged = std::string(preferencesFile) + ".damaged";
  EXPECT_EQ(tree.file(damaged), "<dict>");
  EXPECT_EQ(tree.lastEffect().where, damaged + ", " + preferencesFile);
}

/// The preference of keyboards, and the kernel's architecture.
TEST(LinuxPropertyLists, LoseTheirKeyInAReset) {
  for (const auto& [name, file, key, before, without] :
       {std::tuple(setting::keyboardLockPreference, preferencesFile, DunmereLockEnclosureStateKey, "off", ""),
        {setting::kernelArchitecture, BootLoaderFile::path, BootLoaderFile::architectureKey, "x86_64", "default"}}) {
    const auto value = name == std::string(setting::kernelArchitecture) ? "<string>x86_64</string>" : "<false/>";
    const auto own = std::string("<key>") + key + "</key>" + value;
    const std::string other = "<key>Timeout</key><integer>5</integer>";
    for (const bool hasOthers : {true, false}) {
      LinuxTree tree;
      tree.write(file, "<plist><dict>" + own + (hasOthers ? other : "") + "</dict></plist>");
      for (const auto outcome : {Outcome::applied, Outcome::unchanged}) {
        tree.log.effects.clear();
        tree.host().resets().reset(name);
        const auto& effect = tree.log.effects.at(0);
        EXPECT_EQ(effect.outcome, outcome) << toJson(effect);
        EXPECT_EQ(effect.before.value_or(""), outcome == Outcome::applied ? before : without) << name;
        EXPECT_EQ(effect.stored.value_or(""), without) << name;
        EXPECT_EQ(tree.has(file), hasOthers) << name;
      }
      if (!hasOthers) continue;
      EXPECT_THAT(tree.file(file), AllOf(HasSubstr("Timeout"), Not(HasSubstr(key))));
    }
    LinuxTree damaged;
    damaged.write(file, "<dict>");
    damaged.host().resets().reset(name);
    EXPECT_THAT(damaged.log.effects.at(0), FailedFor(file));
    EXPECT_EQ(damaged.file(file), "<dict>");
  }
}

/// What a signal to a process of this machine comes to. A whole host would tell the journal of the machine too.
Effect effectOf(int signal, ProcessId process) {
  EffectSink effects;
  EffectLog log;
  effects.addChannel(log);
  RunLoop runLoop;
  const SystemRoot root("/");
  ServiceAccess services(root, runLoop);
  const LinuxMachine machine{root, effects, runLoop, services};
  IpmiDevice link(root, runLoop);
  ManagementController controller(link);
  LinuxPreferencesStore preferences(machine, controller);
  LinuxProcessUtilities(machine, preferences).sendSignal(signal, process);
  return log.effects.back();
}

TEST(LinuxProcesses, GetSignals) {
  const auto child = ::fork();
  if (child == 0) {
    ::pause();
    ::_exit(0);
  }
  EXPECT_EQ(effectOf(SIGTERM, child), (Effect{.setting = setting::signalToProcess,
                                              .asked = "15 to process " + std::to_string(child),
                                              .changed = true}));
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGTERM);
  EXPECT_EQ(effectOf(SIGTERM, child).failure->code, std::errc::no_such_process);
  for (const ProcessId group : {0, -1, -::getpgrp(), INT32_MIN})
    EXPECT_THAT(effectOf(SIGCONT, group), FailedFor("no process id"));
}

TEST(LinuxProcesses, AreFoundByNameTheFirstOne) {
  LinuxTree tree;
  for (const char* id : {"90", "1000", "77"}) {
    tree.write(std::string("/proc/") + id + "/stat", std::string(id) + " (sshd) S 1");
    tree.write(std::string("/proc/") + id + "/cmdline", "sshd");
  }
  EXPECT_EQ(tree.host().processes().processNamed("sshd"), 77);
  EXPECT_EQ(tree.host().processes().processNamed("ssh"), 0);
  tree.host().processes().sendSignal(SIGCONT, 77);
  EXPECT_THAT(tree.lastEffect(), FailedFor("a tree of files has no processes"));
}

}  // namespace
}  // namespace tavisk
