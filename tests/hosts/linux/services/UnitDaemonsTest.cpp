// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <tuple>

#include "effects/EffectMatchers.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "hosts/linux/services/ServicesConfig.h"
#include "hosts/linux/services/UnitFiles.h"
#include "hosts/linux/system/Program.h"

namespace tavisk {
namespace {

using testing::ElementsAre, testing::HasSubstr, testing::IsEmpty;
using Fault = FakeServiceManager::Fault;

struct ChronyUnits : ManagedTree {
  ChronyUnits() { haveChrony(*this); }
};
INSTANTIATE_TYPED_TEST_SUITE_P(LinuxWithUnits, NetworkTimeContract, NetworkTimeOf<ChronyUnits>);

struct UnitDaemonsTest : testing::Test {
  ChronyUnits tree;
  NetworkTimeService& client = tree.host().networkTime();
};

TEST_F(UnitDaemonsTest, PrefersTheFirstThatIsNotMasked) {
  tree.manager.set("ntpsec.service", {.active = "activating"});
  EXPECT_FALSE(client.isRunning()) << "chrony comes first";
  tree.manager.set(chrony, {.load = "masked"});
  EXPECT_TRUE(client.isRunning());
  tree.manager.set("ntpsec.service", {.load = "not-found"});
  EXPECT_FALSE(client.isRunning());
}

TEST_F(UnitDaemonsTest, RestartsOtherClientsWithoutWaiting) {
  tree.manager.set(chrony, {.load = "not-found"});
  tree.manager.set("systemd-timesyncd.service", {.active = "active", .jobResult = ""});
  client.restartAsynchronously();
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_THAT(tree.manager.calls(), ElementsAre("TryRestartUnit systemd-timesyncd.service"));
}

TEST(UnitDaemons, TellsWhyAUnitDoesNotRun) {
  const std::tuple<FakeUnit, std::optional<Fault>, const char*> cases[] = {
      {{.jobResult = "failed"}, std::nullopt, "its job ended with: failed"},
      {{.jobResult = ""}, std::nullopt, "its job has not ended in time"},
      {{.conditionHolds = false}, std::nullopt, "the condition ConditionVirtualization=!container does not hold"},
      {{}, Fault::error, "org.freedesktop.DBus.Error.AccessDenied: not today"},
      {{}, Fault::question, "InteractiveAuthorizationRequired"},
      {{}, Fault::wrongType, "the reply has other types than expected"},
      {{}, Fault::hangUp, "Connection"},
  };
  for (const auto& [unit, fault, why] : cases) {
    ChronyUnits tree;
    tree.manager.set(chrony, unit);
    if (fault) tree.manager.breakNext("StartUnit", *fault);
    tree.host().networkTime().start();
    EXPECT_THAT(tree.lastEffect(), FailedFor(why));
    EXPECT_EQ(tree.lastEffect().failure->tried, "StartUnit");
    EXPECT_EQ(tree.lastEffect().failure->code == std::errc::timed_out, unit.jobResult.empty());
    EXPECT_FALSE(tree.host().networkTime().isRunning()) << "asked again, after a hang-up too";
  }
}

struct ManagedDaemons : testing::Test {
  ManagedTree tree;
  Daemons& daemons = tree.services.daemons();
  const Daemon daemon{"a.service", "", ""};
};

TEST_F(ManagedDaemons, HaveDoneAJobThatEndedSo) {
  tree.manager.set(daemon.unit, {.active = "active", .jobResult = "dependency"});
  for (const auto method : {&Daemons::start, &Daemons::stop, &Daemons::restart}) {
    const auto done = (daemons.*method)(daemon);
    ASSERT_FALSE(done);
    EXPECT_EQ(done.failure().why, "its job ended with: dependency");
  }
}

TEST_F(ManagedDaemons, RunWhileTheyAreStartedAnew) {
  const std::tuple<const char*, const char*, bool> cases[] = {
      {"deactivating", "restart", true}, {"inactive", "start", true}, {"failed", "restart", true},
      {"deactivating", "", false},       {"inactive", "stop", false}, {"reloading", "", true},
  };
  for (const auto& [active, job, runs] : cases) {
    tree.manager.set(daemon.unit, {.active = active, .job = job});
    const auto running = daemons.isRunning(daemon);
    EXPECT_TRUE(running && *running == runs) << active << " " << job;
  }
}

TEST_F(ManagedDaemons, AreLookedForByTheManagerOnlyWhereAFileIs) {
  tree.manager.set("missed.service", {.load = "not-found"});
  const std::tuple<const char*, const char*> cases[] = {
      {"b.service", "/run/systemd/transient/b.service"},
      {"b@one.service", "/usr/lib/systemd/system/b@.service"},
      {"missed.service", "/etc/systemd/system/missed.service"},
  };
  for (const auto& [unit, file] : cases) {
    const Daemon other{unit, "", ""};
    tree.manager.breakNext("ListUnitsByNames", Fault::error);
    const auto absent = daemons.presence(other);
    EXPECT_TRUE(absent && *absent == Daemons::Presence::absent) << unit;
    tree.write(file, "");
    EXPECT_FALSE(daemons.presence(other)) << "the manager was not asked about " << unit;
  }
}

TEST_F(ManagedDaemons, AreLookedForByTheManagerWhereAFolderCannotBeLookedInto) {
  const std::string folder = "/run/systemd/transient";
  tree.link(folder, folder);
  const auto absent = daemons.presence({"b.service", "", ""});
  EXPECT_TRUE(absent && *absent == Daemons::Presence::absent);
  tree.manager.breakNext("ListUnitsByNames", Fault::error);
  EXPECT_FALSE(daemons.presence({"b.service", "", ""})) << "nobody knows";
}

TEST_F(ManagedDaemons, RunOnWhenTheirFileIsGone) {
  tree.manager.set(daemon.unit, {.load = "not-found", .active = "active"});
  const auto running = daemons.isRunning(daemon);
  EXPECT_TRUE(running && *running);
}

TEST_F(ManagedDaemons, HaveNotBegunWhatNoTimeWasLeftFor) {
  EXPECT_TRUE(daemons.isRunning(daemon)) << "connects";
  const auto limit = tree.runLoop.limitWaits(std::chrono::milliseconds(0));
  const auto run = runProgram(tree.root, {"/usr/bin/true"}, tree.runLoop);
  for (const auto& failure : {daemons.start(daemon).failure(), run.failure()}) {
    EXPECT_THAT(failure.why, HasSubstr("timed out before it was"));
    EXPECT_FALSE(failure.code) << "nothing of it can come about";
  }
}

TEST_F(ManagedDaemons, StartWithTheMachineByRootOnly) {
  tree.manager.set(daemon.unit, {.file = "enabled"});
  EXPECT_TRUE(daemons.startsAtBoot(daemon)) << "connects";
  EXPECT_TRUE(daemons.checkMayStartAtBoot(daemon, false));
  // Of this thread alone; the manager's goes on.
  const auto become = [](uid_t user) { return ::syscall(SYS_setresuid, -1, user, -1); };
  if (become(65534) != 0) GTEST_SKIP() << "only root can be somebody else";
  WrittenPlaces written;
  const auto disabled = daemons.setStartAtBoot({daemon}, false, written);
  const auto mayDisable = daemons.checkMayStartAtBoot(daemon, false);
  const auto mayEnable = daemons.checkMayStartAtBoot(daemon, true);
  ASSERT_EQ(become(0), 0);
  ASSERT_FALSE(disabled);
  EXPECT_EQ(describe(disabled.failure()), "disable on a.service: needs root: sudo tavisk ...");
  EXPECT_FALSE(mayDisable);
  EXPECT_TRUE(mayEnable) << "there is nothing to change";
  EXPECT_THAT(tree.manager.calls(), IsEmpty());
}

TEST(UnitFiles, ShowWhatIsEnabledWhereNothingStandsInTheWay) {
  const std::string package = "/usr/lib/systemd/system/a.service";
  const std::string wanted = "/etc/systemd/system/default.target.wants/a.service";
  const std::tuple<const char*, const char*, bool> spoils[] = {
      {"", "", true},
      {"/etc/systemd/system/a.service", "/dev/null", false},
      {"/run/systemd/system/a.service", "/dev/null", false},
      {"/usr/local/lib/systemd/system/a.service", nullptr, false},
      {package.c_str(), "b.service", false},
      {wanted.c_str(), nullptr, false},
  };
  for (const auto& [path, target, isEnabled] : spoils) {
    LinuxTree files;
    EXPECT_FALSE(isEnabledBeyondDoubt(files.root, "a.service")) << "without files";
    files.write(package, "[Unit]\n");
    files.write("/etc/systemd/system/default.target.d/a.service", "");
    EXPECT_FALSE(isEnabledBeyondDoubt(files.root, "a.service")) << "without a link";
    files.link(wanted, package);
    if (*path != '\0') std::filesystem::remove(files.at(path));
    if (*path != '\0') target ? files.link(path, target) : files.write(path, "");
    EXPECT_EQ(isEnabledBeyondDoubt(files.root, "a.service"), isEnabled) << path;
  }
}

TEST_F(UnitDaemonsTest, TellOfAManagerThatRefusesAndWaitOnceForOneThatIsSilent) {
  tree.manager.breakNext("EnableUnitFiles", Fault::error);
  client.setLaunchAtStartup(true);
  EXPECT_THAT(tree.lastEffect(), FailedFor("EnableUnitFiles on chrony.service"));
  EXPECT_EQ(tree.lastEffect().failure->code, BusErrorCode::accessDenied);
  const auto began = RunLoop::Clock::now();
  tree.manager.breakNext("ListUnitsByPatterns", Fault::silence);
  client.start();
  EXPECT_THAT(tree.lastEffect(), FailedFor("timed out"));
  EXPECT_LT(RunLoop::Clock::now() - began, Bus::usualTime + std::chrono::milliseconds(500));
}

TEST(UnitDaemons, DoNotLookElsewhereWhenTheManagerCannotBeReached) {
  LinuxTree tree;
  tree.write("/run/systemd/system/x", "");
  tree.writeProgram("/etc/init.d/chrony", "#!/bin/sh\n");
  EXPECT_FALSE(tree.host().networkTime().isRunning());
  EXPECT_THAT(tree.lastEffect(), FailedFor("/run/dbus/system_bus_socket"));
}

TEST(ServicesConfig, NamesUnitsThatMayBeSwitched) {
  const std::pair<const char*, std::vector<std::string>> cases[] = {
      {"", {}},
      {"# remote-events = a.service\nother = b.service\n", {}},
      {"remote-events = a.service\nremote-events=b@1.socket  my-group.target\r\n", {"b@1.socket", "my-group.target"}},
      {"remote-events =\n", {}},
  };
  for (const auto& [text, units] : cases) {
    LinuxTree tree;
    tree.write(servicesConfig, text);
    EXPECT_EQ(configuredUnits(tree.root, "remote-events").valueOr({"failed"}), units) << text;
  }
  for (const char* unit : {"a", ".service", "a.mount", "a/b.service", "../a.service", "dbus.service", "dbus.socket",
                           "systemd-journald.service", "reboot.target", "remote-fs-pre.target", "hybrid-sleep.target",
                           "multi-user.target", "runlevel0.target"}) {
    LinuxTree tree;
    tree.write(servicesConfig, std::string("remote-events = a.service ") + unit);
    EXPECT_FALSE(configuredUnits(tree.root, "remote-events")) << unit;
  }
}

}  // namespace
}  // namespace tavisk
