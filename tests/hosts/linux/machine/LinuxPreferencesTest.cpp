// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>

#include "hosts/linux/LinuxTree.h"
#include "hosts/shared/FileLock.h"
#include "platform/PreferencesContract.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::HasSubstr;

constexpr const char* preferencesFile = "/etc/tavisk/preferences/AnyApplication.plist";

struct NoController final : ControllerLink {
  Result<void> open() override { return systemFailure("open", "no controller", ENODEV); }
  Result<std::vector<std::uint8_t>> exchange(const ControllerRequest&) override { return open().failure(); }
};

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
  tree.write(preferencesFile, "<plist><dict><key>other</key><date>2026-01-01T00:00:00Z</date></dict></plist>");
  processes.setMachineBoolean("b", false);
  processes.writeMachinePreferences();
  for (const char* part : {"<key>other</key>", "2026-01-01T00:00:00Z", "<key>a</key>", "<key>b</key>"})
    EXPECT_THAT(tree.file(preferencesFile), HasSubstr(part));
}

TEST(LinuxPreferences, AreNotWrittenUnderAnothersLockNorOverDamage) {
  LinuxTree tree;
  tree.write(preferencesFile, "<dict>");
  EXPECT_FALSE(tree.host().preferences().value("a"));
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr(preferencesFile)));
  auto& processes = tree.host().processes();
  processes.setMachineBoolean("a", true);
  {
    const auto held = lockFile(SystemRoot(tree.at("/")), "/etc/tavisk/preferences/.lock", std::chrono::seconds(0));
    processes.writeMachinePreferences();
    EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("another run keeps it locked")));
  }
  EXPECT_EQ(tree.file(preferencesFile), "<dict>");
  processes.setMachineBoolean("a", true);
  processes.writeMachinePreferences();
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"applied")"));
  EXPECT_EQ(tree.file(std::string(preferencesFile) + ".damaged"), "<dict>");
}

/// What a signal to a process of this machine comes to. A whole host would tell the journal of the machine too.
std::string told(ProcessId process, int signal) {
  EffectSink effects;
  EffectLog log;
  effects.addChannel(log);
  RunLoop runLoop;
  const SystemRoot root("/");
  ServiceAccess services(root, runLoop);
  const LinuxMachine machine{root, effects, runLoop, services};
  LinuxPreferencesStore preferences(machine);
  NoController link;
  ManagementController controller(link);
  LinuxProcessUtilities(machine, preferences, controller).sendSignal(signal, process);
  return log.lines.back();
}

TEST(LinuxProcesses, GetSignals) {
  const auto child = ::fork();
  if (child == 0) {
    ::pause();
    ::_exit(0);
  }
  EXPECT_THAT(told(child, SIGTERM), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr("15 to process")));
  int status = 0;
  ASSERT_EQ(::waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == SIGTERM);
  EXPECT_THAT(told(child, SIGTERM), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("No such process")));
  for (ProcessId group : {0, -1, -child, INT32_MIN}) EXPECT_THAT(told(group, SIGTERM), HasSubstr("no process id"));
}

TEST(LinuxProcesses, AreFoundByNameTheFirstOne) {
  LinuxTree tree;
  for (const char* id : {"90", "1000", "77"}) {
    tree.write(std::string("/proc/") + id + "/stat", std::string(id) + " (sshd) S 1");
    tree.write(std::string("/proc/") + id + "/cmdline", "sshd");
  }
  EXPECT_EQ(tree.host().processes().processNamed("sshd"), 77);
  EXPECT_EQ(tree.host().processes().processNamed("ssh"), 0);
  tree.host().processes().sendSignal(SIGHUP, 77);
  EXPECT_THAT(tree.lastTold(), HasSubstr("a tree of files has no processes"));
}

}  // namespace
}  // namespace tavisk
