// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "bus/BusTree.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "hosts/shared/ZoneList.h"
#include "platform/HostNamesContract.h"

namespace tavisk {
namespace {

using testing::ElementsAreArray;

class ChronyBusTree : public BusTree {
 public:
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

/// What the daemon itself answers.
class TimeDaemon {
 public:
  explicit TimeDaemon(const BusTree& tree) : _root(tree.at("/")), _services(_root, _runLoop) {}
  std::string zone() { return bus().property(object, "Timezone", "s").value().readText(); }
  std::vector<ZoneName> zones() {
    std::vector<ZoneName> zones;
    for (const auto& name : bus().call(object, "ListTimezones", "as").value().readTexts()) zones.push_back({name});
    return zones;
  }

 private:
  Bus& bus() { return *_services.systemBus().value(); }
  const BusObject object{"org.freedesktop.timedate1", "/org/freedesktop/timedate1", "org.freedesktop.timedate1"};
  SystemRoot _root;
  RunLoop _runLoop;
  ServiceAccess _services;
};

TEST(TimeDaemon, KnowsTheZonesThatWeList) {
  const auto source = contentsOf("/usr/share/zoneinfo/tzdata.zi");
  const auto installed = installedZones(SystemRoot("/")).value();
  BusTree tree;
  tree.write("/usr/share/zoneinfo/tzdata.zi", source);
  for (const auto& zone : installed) tree.write(zone.file(), "TZif2");
  EXPECT_GT(installed.size(), 400U);
  EXPECT_THAT(tree.host().clock().knownTimeZones(), ElementsAreArray(TimeDaemon(tree).zones()));
}

TEST(TimeDaemon, IsToldTheZoneAndTheNameFileFollows) {
  BusTree tree;
  tree.write("/usr/share/zoneinfo/Asia/Tokyo", "TZif2");
  tree.write("/etc/timezone", "Etc/UTC\n");
  tree.host().clock().setTimeZone({"Asia/Tokyo"});
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.file("/etc/timezone"), "Asia/Tokyo\n");
  EXPECT_EQ(TimeDaemon(tree).zone(), "Asia/Tokyo");
}

TEST(TimeDaemon, RefusesAZoneThatThereIsNot) {
  BusTree tree;
  const auto before = TimeDaemon(tree).zone();
  tree.host().clock().setTimeZone({"Mars/Olympus"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("SetTimezone"));
  EXPECT_EQ(TimeDaemon(tree).zone(), before);
}

TEST(TimeDaemon, IsPassedByWhereItTakesAChangeForNone) {
  BusTree tree;
  for (const char* zone : {"UTC", "Asia/Tokyo"}) tree.write(std::string("/usr/share/zoneinfo/") + zone, "TZif2");
  EXPECT_EQ(TimeDaemon(tree).zone(), "UTC");
  for (const char* change : {"no link", "another link since"}) {
    tree.host().clock().setTimeZone(utc());
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied) << change;
    EXPECT_EQ(std::filesystem::read_symlink(tree.at("/etc/localtime")), "../usr/share/zoneinfo/UTC") << change;
    tree.link("/etc/localtime", "../usr/share/zoneinfo/Asia/Tokyo");
  }
}

TEST(TimeDaemon, RefusesAClockThatIsOutOfReach) {
  ChronyBusTree tree;
  tree.host().clock().setTime(1'166'999'400);
  EXPECT_THAT(tree.lastEffect(), FailedFor("no CAP_SYS_TIME here"));
  EXPECT_EQ(tree.lastEffect().failure->tried, "SetTime");
}

TEST(TimeDaemon, LeavesToUsTheClockThatAClientHolds) {
  ChronyBusTree tree;
  tree.manager.set(chrony, {.active = "active", .file = "enabled"});
  tree.host().clock().setTime(1'166'999'400);
  EXPECT_THAT(tree.lastEffect(), FailedFor("a tree of files has no clock"));
  EXPECT_THAT(tree.lastEffect().undoneBy, testing::HasSubstr("the network-time client"));
}

TEST(TimeDaemon, TellsTheServerInUseWhereNoneIsConfigured) {
  BusTree tree;
  tree.manager.set("systemd-timesyncd.service", {});
  EXPECT_EQ(tree.host().networkTime().server().address, "");
  tree.manager.set("systemd-timesyncd.service", {.active = "active"});
  EXPECT_EQ(tree.host().networkTime().server().address, "fallback.example");
  EXPECT_EQ(tree.log.values.back().live, "fallback.example");
  tree.host().networkTime().setServer({"time.example"});
  EXPECT_EQ(tree.host().networkTime().server().address, "time.example");
}

TEST(ServiceManager, ThatEndedDuringACallIsNotTakenForSilent) {
  ChronyBusTree tree;
  tree.manager.breakNext("LoadUnit", FakeServiceManager::Fault::hangUp);
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
  EXPECT_EQ(tree.lastEffect().live, "mail-2.example");
  EXPECT_EQ(tree.file("/etc/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.1.1\tmail-2.example mail-2\n");
  tree.host().hostConfiguration().setComputerName("Mail Server 2");
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.lastEffect().live, "Mail Server 2");
  EXPECT_EQ(tree.file("/etc/machine-info"), "PRETTY_HOSTNAME=\"Mail Server 2\"\n");
}

}  // namespace
}  // namespace tavisk
