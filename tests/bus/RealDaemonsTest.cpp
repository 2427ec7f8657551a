// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "bus/BusTree.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "hosts/shared/ZoneList.h"
#include "platform/HostNamesContract.h"

namespace tavisk {
namespace {

struct ChronyBusTree : BusTree {
  ChronyBusTree() {
    haveChrony(*this);
    write("/etc/systemd/ntp-units.d/10-chrony.list", "chrony.service\n");
  }
};

INSTANTIATE_TYPED_TEST_SUITE_P(OnTheBus, ClockContract, ClockOf<BusTree>);
INSTANTIATE_TYPED_TEST_SUITE_P(OnTheBus, NetworkTimeContract, NetworkTimeOf<ChronyBusTree>);

struct NamesOnTheBus {
  HostConfigService& configuration() { return tree.host().hostConfiguration(); }
  DynamicStore& store() { return tree.host().dynamicStore(); }
  BusTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(OnTheBus, HostNamesContract, NamesOnTheBus);

class TimeDaemonTest : public testing::Test {
 protected:
  /// What the daemon itself answers.
  std::string daemonsZone() { return bus().property(object, "Timezone", "s").value().readText(); }
  std::vector<std::string> daemonsZones() { return bus().call(object, "ListTimezones", "as").value().readTexts(); }

  const std::string source = contentsOf("/usr/share/zoneinfo/tzdata.zi");  // the tree hides it
  const std::vector<ZoneName> installed = installedZones(SystemRoot("/")).value();
  ChronyBusTree tree;
  ClockService& clock = tree.host().clock();

 private:
  Bus& bus() { return *tree.services.systemBus().value(); }
  const BusObject object{"org.freedesktop.timedate1", "/org/freedesktop/timedate1", "org.freedesktop.timedate1"};
};

TEST_F(TimeDaemonTest, KnowsTheZonesThatWeList) {
  tree.write("/usr/share/zoneinfo/tzdata.zi", source);
  for (const auto& zone : installed) tree.write(zone.file(), "TZif2");
  EXPECT_GT(installed.size(), 400U);
  std::vector<std::string> zones;
  for (const auto& zone : clock.knownTimeZones()) zones.push_back(zone.text);
  EXPECT_EQ(zones, daemonsZones());
}

TEST_F(TimeDaemonTest, IsToldTheZoneAndTheNameFileFollows) {
  tree.write("/usr/share/zoneinfo/Asia/Tokyo", "TZif2");
  tree.write("/etc/timezone", "Etc/UTC\n");
  clock.setTimeZone({"Asia/Tokyo"});
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.file("/etc/timezone"), "Asia/Tokyo\n");
  EXPECT_EQ(daemonsZone(), "Asia/Tokyo");
  clock.setTimeZone({"Mars/Olympus"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("there is no such zone"));
  EXPECT_EQ(daemonsZone(), "Asia/Tokyo");
}

TEST_F(TimeDaemonTest, IsPassedByWhereItTakesAChangeForNone) {
  for (const char* zone : {"UTC", "Asia/Tokyo"}) tree.write(std::string("/usr/share/zoneinfo/") + zone, "TZif2");
  EXPECT_EQ(daemonsZone(), "UTC");
  for (const char* change : {"no link", "another link since"}) {
    clock.setTimeZone(utc());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << change;
    EXPECT_EQ(std::filesystem::read_symlink(tree.at("/etc/localtime")), "../usr/share/zoneinfo/UTC") << change;
    tree.link("/etc/localtime", "../usr/share/zoneinfo/Asia/Tokyo");
  }
}

TEST_F(TimeDaemonTest, LeavesToUsTheClockThatAClientHolds) {
  clock.setTime(1'166'999'400);
  EXPECT_THAT(tree.lastEffect(), FailedFor("no CAP_SYS_TIME here"));
  EXPECT_EQ(tree.lastEffect().failure->tried, "SetTime");
  tree.manager.set(chrony, {.active = "active", .file = "enabled"});
  clock.setTime(1'166'999'400);
  EXPECT_THAT(tree.lastEffect(), FailedFor("a tree of files has no clock"));
  EXPECT_THAT(tree.lastEffect().undoneBy, testing::HasSubstr("the network-time client"));
}

TEST(TimeSyncDaemon, TellsTheServerInUseWhereNoneIsConfigured) {
  BusTree tree;
  tree.manager.set("systemd-timesyncd.service", {});
  EXPECT_EQ(tree.host().networkTime().server().address, "");
  tree.manager.set("systemd-timesyncd.service", {.active = "active"});
  EXPECT_EQ(tree.host().networkTime().server().address, "fallback.example");
  EXPECT_EQ(tree.log.values.back().live, "fallback.example");
  tree.log.wants = true;
  // The daemon drops the second of the same name.
  tree.write("/etc/systemd/timesyncd.conf.d/70-more.conf", "[Time]\nNTP=time.example\n");
  for (const auto& [server, restarts] : {std::pair("time.example", 1U), {"time.example", 1U}, {"next.example", 2U}}) {
    tree.host().networkTime().setServer({server});
    tree.host().networkTime().restartAsynchronously();
    EXPECT_EQ(std::ranges::count(tree.manager.calls(), "TryRestartUnit systemd-timesyncd.service"), restarts);
    EXPECT_EQ(tree.host().networkTime().server().address, server);
    EXPECT_EQ(tree.log.values.back().live, "fallback.example");
    EXPECT_EQ(tree.log.values.back().stored, server);
  }
}

TEST(TimeSyncDaemon, TellsHowFarTheClockIsFromItsServer) {
  BusTree tree;
  tree.log.wants = tree.log.wantsWhere = true;
  tree.manager.set("systemd-timesyncd.service", {.active = "active"});
  EXPECT_TRUE(tree.host().networkTime().isRunning());
  EXPECT_EQ(tree.log.values.back().facts,
            Facts({{"source", "fallback.example"}, {"milliseconds ahead of the source", "-1.500"}}));
}

TEST(ServiceManager, ThatEndedDuringACallIsNotTakenForSilent) {
  ChronyBusTree tree;
  tree.manager.breakNext("ListUnitsByPatterns", FakeServiceManager::Fault::hangUp);
  EXPECT_FALSE(tree.host().networkTime().isRunning());
  EXPECT_THAT(tree.lastEffect(), FailedFor("DBus.Error.NoReply"));
  EXPECT_FALSE(tree.host().networkTime().isRunning());
  EXPECT_EQ(tree.lastEffect().failure->code, BusErrorCode::serviceUnknown);
}

TEST(NameDaemon, GivesTheMachineTheNameEverywhere) {
  BusTree tree;
  tree.write("/etc/hostname", "machine\n");
  tree.write("/etc/hosts", "127.0.1.1\tmachine\n");
  tree.host().hostConfiguration().setLocalNetworkName("mail-2.example");
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.lastEffect().live, "mail-2");
  EXPECT_EQ(tree.file("/etc/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.1.1\tmail-2.example mail-2\n");
}

}  // namespace
}  // namespace tavisk
