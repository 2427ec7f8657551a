// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <systemd/sd-bus.h>

#include <atomic>
#include <thread>

#include "base/Calendar.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "hosts/linux/clock/LinuxClockService.h"
#include "hosts/linux/clock/LocalTime.h"
#include "hosts/linux/clock/SystemClock.h"

namespace tavisk {
namespace {

TEST(LocalTime, FindsTheZoneInEveryShapeOfLink) {
  constexpr const char* none = "";
  const std::pair<const char*, const char*> cases[] = {
      {"/usr/share/zoneinfo/Europe/Paris", "Europe/Paris"},
      {"../usr/share/zoneinfo/America/Argentina/Ushuaia", "America/Argentina/Ushuaia"},
      {"/usr/share/zoneinfo/posix/Etc/GMT+5", "Etc/GMT+5"},
      {"/usr/share/zoneinfo/right/UTC", "UTC"},
      {"/etc/zoneinfo/Asia/Tokyo", "Asia/Tokyo"},
      {"/usr/share/zoneinfo/", none},
      {"/usr/share/zoneinfo//Europe/Paris", none},
      {"/usr/share/zoneinfo/../../../etc/passwd", none},
      {"/usr/share/zoneinfo/Europe\n/Paris", none},
      {"/opt/clock", none},
      {"", none},
  };
  for (const auto& [path, zone] : cases) EXPECT_EQ(zoneOfPath(path).value_or(ZoneName{}).text, zone) << path;
}

TEST(LocalTime, ReadsTheNameFileWhereTheLinkSaysNothing) {
  const std::pair<const char*, const char*> cases[] = {
      {"Europe/Paris\n", "Europe/Paris"},  {"  Asia/Tokyo \r\n", "Asia/Tokyo"},
      {"# ours\n\nUTC\nEtc/GMT\n", "UTC"}, {"", "UTC"},
      {"../../etc/passwd\n", "UTC"},
  };
  for (const auto& [contents, zone] : cases) {
    LinuxTree tree;
    tree.write("/etc/localtime", "TZif2");
    tree.write("/etc/timezone", contents);
    EXPECT_EQ(tree.host().clock().timeZone().text, zone) << contents;
  }
}

TEST(LocalTime, TellsTheZoneInForceApartFromTheNameBeside) {
  constexpr const char* paris = "Europe/Paris";
  const std::tuple<std::string, const char*, const char*, const char*> cases[] = {
      {"none", "UTC", "UTC", paris},
      {"TZif Paris", paris, "Europe/Paris, by the rules in /etc/localtime", paris},
      {"TZif Tokyo", "Asia/Tokyo", "Asia/Tokyo, by the rules in /etc/localtime", paris},
      {"TZif Mars", paris, "rules of no known zone in /etc/localtime", paris},
      {"/opt/clock", "UTC", "UTC", "UTC, Europe/Paris in /etc/timezone"},
      {"/usr/share/zoneinfo/Asia/Tokyo", "Asia/Tokyo", "Asia/Tokyo", "Asia/Tokyo, Europe/Paris in /etc/timezone"},
      {"/usr/share/zoneinfo/No/Where", "No/Where", "UTC, without /usr/share/zoneinfo/No/Where",
       "No/Where, Europe/Paris in /etc/timezone"},
  };
  for (const auto& [text, zone, live, stored] : cases) {
    LinuxTree tree;
    tree.log.wants = true;
    tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif Paris");
    tree.write("/usr/share/zoneinfo/Asia/Tokyo", "TZif Tokyo");
    tree.write("/etc/timezone", "Europe/Paris");
    if (text.starts_with('/')) tree.link("/etc/localtime", text);
    if (text.starts_with("TZ")) tree.write("/etc/localtime", text);
    EXPECT_EQ(tree.host().clock().timeZone().text, zone) << text;
    EXPECT_EQ(tree.log.values.back(), (SettingValue{setting::timeZone, live, stored})) << text;
    tree.host().clock().setTimeZone({"Europe/Paris"});
    EXPECT_EQ(tree.lastEffect().where, "/etc/localtime") << text;
    EXPECT_TRUE(tree.lastEffect().changed) << text;
    EXPECT_EQ(tree.lastEffect().live, "Europe/Paris") << text;
  }
}

TEST(LocalTime, KeepsLinkAndNameFileInLine) {
  LinuxTree tree;
  const ZoneName paris{"Europe/Paris"};
  tree.write(paris.file(), "TZif2");
  tree.link("/etc/localtime", paris.file());
  tree.write("/etc/timezone", "Etc/UTC\n");
  tree.host().clock().setTimeZone(paris);
  EXPECT_EQ(tree.log.effects.back().outcome, Outcome::applied) << "one of the two was stale";
  EXPECT_EQ(tree.lastEffect().where, "/etc/timezone");
  EXPECT_EQ(tree.file("/etc/timezone"), "Europe/Paris\n");
  const ZoneName olympus{"Mars/Olympus"};
  tree.host().clock().setTimeZone(olympus);
  EXPECT_EQ(tree.log.effects.back().failure, (Failure{"set the time zone", olympus.file(), "there is no such zone"}));
  EXPECT_EQ(std::filesystem::read_symlink(tree.at("/etc/localtime")), paris.file()) << "it was right as it was";
  EXPECT_EQ(tree.file("/etc/timezone"), "Europe/Paris\n");
}

TEST(LocalTime, IsChangedWhereHalfOfItIs) {
  LinuxTree tree;
  tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif2");
  const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "Get") return sd_bus_reply_method_return(call, "v", "s", "Europe/Paris");
    tree.link("/etc/localtime", "../usr/share/zoneinfo/" + firstText(call));
    tree.makeUnreadable("/etc/timezone");
    return sd_bus_reply_method_return(call, "");
  });
  tree.host().clock().setTimeZone({"Europe/Paris"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("/etc/timezone"));
  EXPECT_EQ(tree.lastEffect().where, "/etc/localtime");
  EXPECT_TRUE(tree.lastEffect().changed);
}

TEST(LocalTime, FollowsADaemonThatFailsWhenItHasMovedTheLink) {
  LinuxTree tree;
  tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif2");
  tree.write("/etc/timezone", "UTC\n");
  const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "Get") return sd_bus_reply_method_return(call, "v", "s", "UTC");
    tree.link("/etc/localtime", "../usr/share/zoneinfo/" + firstText(call));
    return sd_bus_reply_method_errorf(call, SD_BUS_ERROR_FAILED, "too late");
  });
  tree.host().clock().setTimeZone({"Europe/Paris"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("too late"));
  EXPECT_EQ(tree.lastEffect().where, "/etc/localtime, /etc/timezone");
  EXPECT_EQ(tree.file("/etc/timezone"), "Europe/Paris\n");
}

/// Puts something in the place of a file that cannot be looked at, or that keeps a reader waiting.
void obstruct(const LinuxTree& tree, const std::string& path, bool isFifo) {
  const auto place = tree.at(path);
  std::filesystem::create_directories(place.parent_path());
  std::filesystem::remove_all(place);
  isFifo ? static_cast<void>(::mkfifo(place.c_str(), 0600)) : std::filesystem::create_symlink(place.filename(), place);
}

TEST(LocalTime, IsSetWhereAllCanBeLookedAtOnly) {
  const ZoneName paris{"Europe/Paris"};
  for (const auto& [path, isHarmless] :
       {std::pair<std::string, bool>("/etc/localtime", true), {"/etc/timezone", false}, {paris.file(), false}}) {
    for (const bool isFifo : {false, true}) {
      LinuxTree tree;
      auto& clock = tree.host().clock();
      tree.write(paris.file(), "TZif2");
      obstruct(tree, path, isFifo);
      EXPECT_EQ(clock.timeZone(), utc());
      clock.setTimeZone(paris);
      EXPECT_EQ(tree.lastEffect().outcome, isHarmless ? Outcome::applied : Outcome::failed) << path;
      EXPECT_EQ(tree.has("/etc/localtime"), isHarmless) << path;
      setDefaultTimeZone(clock.rulesOf(paris));
    }
  }
}

TEST(LocalTime, IsNotHalfSetByWhoIsNotRoot) {
  LinuxTree tree;
  auto& clock = tree.host().clock();
  std::atomic<int> calls = 0;
  tree.write("/run/tavisk/lock", "");
  const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "Get") return sd_bus_reply_method_return(call, "v", "s", calls == 0 ? "UTC" : "Europe/Paris");
    ++calls;
    tree.link("/etc/localtime", "../usr/share/zoneinfo/" + firstText(call));
    return sd_bus_reply_method_return(call, "");
  });
  tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif2");
  tree.write("/etc/timezone", "UTC\n");
  clock.setTimeZone({"Mars/Olympus"});  // the fake lets root connect only
  const AsMember member(tree);
  clock.setTimeZone({"Europe/Paris"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("/etc/timezone: needs root: sudo tavisk"));
  EXPECT_EQ(calls, 0);
  std::filesystem::remove(tree.at("/etc/timezone"));
  clock.setTimeZone({"Europe/Paris"});
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
}

INSTANTIATE_TYPED_TEST_SUITE_P(Linux, ClockContract, ClockOf<LinuxTree>);

TEST(LinuxClock, LeavesTheClockOfThisMachineAloneAndNamesWhatWouldSetItBack) {
  LinuxTree tree;
  tree.write("/proc/10/stat", "10 (VBoxService) S 1");
  tree.write("/proc/10/cmdline", "/usr/sbin/VBoxService");
  tree.host().clock().setTime(1'166'999'400);
  EXPECT_THAT(tree.lastEffect(), FailedFor("a tree of files has no clock"));
  EXPECT_EQ(tree.lastEffect().undoneBy, "VBoxService");
  tree.write("/sys/class/rtc/rtc0/since_epoch", "1166999400\n");
  tree.host().clock().setTime(1'166'999'400);
  EXPECT_EQ(tree.lastEffect().where, "") << "the hardware clock has that time by chance";
  tree.log.wants = true;
  tree.host().clock().now();
  EXPECT_EQ(tree.log.values.back().stored, "1166999400");
}

TEST(LocalTime, IsSetAnewWhereTheDaemonGoesByAnother) {
  LinuxTree tree;
  std::string daemons = "Asia/Tokyo";
  const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "Get") return sd_bus_reply_method_return(call, "v", "s", daemons.c_str());
    daemons = firstText(call);
    return sd_bus_reply_method_return(call, "");
  });
  tree.write("/usr/share/zoneinfo/UTC", "TZif2");
  tree.link("/etc/localtime", "/usr/share/zoneinfo/UTC");
  for (const auto outcome : {Outcome::applied, Outcome::unchanged}) {
    tree.host().clock().setTimeZone(utc());
    EXPECT_EQ(tree.lastEffect().outcome, outcome);
  }
  EXPECT_EQ(tree.log.effects.front().before, "UTC, Asia/Tokyo in org.freedesktop.timedate1");
}

TEST(LinuxClock, ReadsTheHardwareClockInTheTimeThatItKeeps) {
  LinuxTree tree;
  EXPECT_EQ(*hardwareTime(tree.root), std::nullopt);
  setDefaultTimeZone("/usr/share/zoneinfo/Asia/Tokyo");
  obstruct(tree, "/sys/class/rtc/rtc0/since_epoch", false);
  EXPECT_FALSE(hardwareTime(tree.root));
  std::filesystem::remove(tree.at("/sys/class/rtc/rtc0/since_epoch"));
  tree.write("/sys/class/rtc/rtc0/since_epoch", "1166999400\n");
  EXPECT_EQ(*hardwareTime(tree.root), 1'166'999'400);
  tree.write("/etc/adjtime", "0.0 0 0.0\n0\nLOCAL\n");
  EXPECT_EQ(*hardwareTime(tree.root), 1'166'999'400 - 9 * 3600);
  obstruct(tree, "/etc/adjtime", true);
  EXPECT_FALSE(hardwareTime(tree.root));
}

TEST(LinuxClock, CountsFromTheMomentInWhichItIsAsked) {
  using std::chrono::microseconds;
  LinuxTree tree;
  std::atomic<std::int64_t> ahead = 0;
  const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "Get") return sd_bus_reply_method_return(call, "v", "b", 0);
    std::int64_t number = 0;
    sd_bus_message_read_basic(call, 'x', &number);
    ahead = number;
    return sd_bus_reply_method_return(call, "");
  });
  const auto answerLate = [] {
    std::this_thread::sleep_for(std::chrono::milliseconds(500));
    return Result<void>();
  };
  const LinuxMachine machine{tree.root, tree.effects, tree.runLoop, tree.services, answerLate};
  const std::chrono::seconds asked(systemTime() + 1000);
  const auto begun = std::chrono::system_clock::now().time_since_epoch();
  LinuxClockService(machine).setTime(asked.count());
  EXPECT_LT(std::chrono::abs(microseconds(ahead) - (asked - begun)), std::chrono::milliseconds(300));
  AskedTime direct(asked.count());
  EXPECT_TRUE(answerLate());
  EXPECT_GE(direct.now() - asked, std::chrono::milliseconds(500));
}

TEST(AskedTime, IsWhatTheClocksSayWhenTheyAreNear) {
  LinuxTree tree;
  const auto now = systemTime();
  tree.write("/sys/class/rtc/rtc0/since_epoch", std::to_string(now));
  EXPECT_NE(AskedTime(now - 1).onSystemClock(), now - 1) << "nothing was set yet";
  for (const auto& [ahead, system, hardware] : {std::tuple(0, true, true), {1, true, true}, {4, false, false}}) {
    AskedTime asked(now + ahead);
    asked.isSet();
    EXPECT_EQ(asked.onSystemClock() == now + ahead, system) << ahead;
    EXPECT_EQ(*asked.onHardwareClock(tree.root) == now + ahead, hardware) << ahead;
  }
}

}  // namespace
}  // namespace tavisk
