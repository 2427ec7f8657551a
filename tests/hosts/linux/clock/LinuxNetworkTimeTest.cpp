// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <systemd/sd-bus.h>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/clock/TimeDaemons.h"
#include "hosts/linux/system/CommaList.h"
#include "platform/NetworkTimeContract.h"

namespace tavisk {
namespace {

/// A machine with chrony and init scripts; both programs work on the tree that they stand in.
struct ChronyTree : LinuxTree {
  ChronyTree() {
    haveInitScript("chrony", "chronyd");
    writeProgram("/usr/sbin/chronyd", "");
    write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\n");
    writeProgram("/usr/bin/chronyc", R"sh(#!/bin/sh
root=${0%/usr/bin/chronyc}
[ "$1" = reload ] || { cat "$root/known"; exit; }
echo "$@" "$(env | grep -v -e ^PWD= -e ^SHLVL= -e ^_= | sort)" > "$root/reloaded"
cat "$root"/etc/chrony/sources.d/*.sources 2> /dev/null | sed -n 's/^server \([^ ]*\).*/^,?,\1,0,6/p' > "$root/known"
)sh");
  }
};

struct LinuxNetworkTime {
  static constexpr bool takesAnyText = false;
  NetworkTimeService& service() { return tree.host().networkTime(); }
  bool launchesAtStartup() { return tree.has("/etc/rc2.d/S01chrony"); }
  ChronyTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, NetworkTimeContract, LinuxNetworkTime);

struct ChronyTest : testing::Test {
  ChronyTree tree;
  NetworkTimeService& client = tree.host().networkTime();
};

TEST_F(ChronyTest, WritesTheServerWhereTheClientReadsItAgain) {
  client.setServer({"time.example"});
  EXPECT_EQ(tree.file("/etc/chrony/sources.d/60-tavisk.sources"),
            "# Written by tavisk. Changes made here are replaced.\nserver time.example iburst prefer\n");
  client.restartAsynchronously();
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.file("/reloaded"), "reload sources LC_ALL=C\nPATH=/usr/sbin:/usr/bin:/sbin:/bin\n");
  tree.write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\npool pool.example iburst\n");
  client.setServer({"next.example"});
  EXPECT_EQ(tree.lastEffect().note, "configured elsewhere, stays in use behind it: pool.example");
}

TEST_F(ChronyTest, IsLeftAloneWhenItGoesByItsServerAlready) {
  constexpr const char* own = "/etc/chrony/sources.d/60-tavisk.sources";
  const auto isRestartedAfter = [&](const char* server) {
    tree.write("/reloaded", "");
    client.setServer({server});
    client.restartAsynchronously();
    EXPECT_FALSE(tree.lastEffect().changed);
    return !tree.file("/reloaded").empty();
  };
  EXPECT_TRUE(isRestartedAfter("time.example"));
  for (const char* same : {"time.example", "two words", ""}) EXPECT_FALSE(isRestartedAfter(same)) << same;
  tree.write("/known", "^,?,other.example,0\n");
  EXPECT_TRUE(isRestartedAfter("time.example")) << "a run was cut off before it";
  tree.write(own, "server time.example iburst\n");
  EXPECT_TRUE(isRestartedAfter("time.example")) << "chronyc does not show that it is preferred now";
  std::filesystem::remove(tree.at("/known"));
  EXPECT_TRUE(isRestartedAfter("time.example")) << "what it goes by is not known";
  tree.write("/etc/chrony/chrony.conf", "pool pool.example iburst\n");
  EXPECT_FALSE(isRestartedAfter("next.example")) << "it does not read the file";
}

TEST_F(ChronyTest, TellsWhatTheNextStartOfTheMachineWouldChange) {
  for (const bool starts : {false, true}) {
    client.setLaunchAtStartup(starts);
    EXPECT_EQ(tree.lastEffect().where, starts ? "/etc/rc2.d/S01chrony" : "") << "it did not start before";
    client.checkLaunchAtStartup(starts);
    EXPECT_EQ(tree.log.effects.size(), starts ? 3 : 1);
    client.checkLaunchAtStartup(!starts);
    EXPECT_THAT(tree.lastEffect(),
                FailedFor(starts ? "type 'tavisk -setusingnetworktime on -setusingnetworktime off'"
                                 : "type 'tavisk -setusingnetworktime off -setusingnetworktime on'"));
    tree.log.wants = true;
    EXPECT_FALSE(client.isRunning());
    EXPECT_EQ(tree.log.values.back().stored, starts ? "on" : "off");
  }
}

TEST_F(ChronyTest, TellsTheServerThatItUsesAndHowFarTheClockIsFromIt) {
  client.setServer({"time.example"});
  client.start();
  tree.write("/known",
             "^,?,time.example,0,6,0,4294967295,0.0,0.0,0.0\n^,*,used.example,2,6,377,20,-0.0012349,0.5,0.03\n");
  tree.log.wants = tree.log.wantsWhere = true;
  EXPECT_EQ(client.server().address, "time.example");
  EXPECT_EQ(tree.log.values.back().live, "used.example");
  EXPECT_TRUE(client.isRunning());
  EXPECT_EQ(tree.log.values.back().facts,
            Facts({{"source", "used.example"}, {"milliseconds ahead of the source", "-1.235"}}));
  for (const auto* line : {"^,*,used.example,2\n", "^,*,used.example,2,6,377,20,nan,0.5,0.03\n"}) {
    tree.write("/known", line);
    EXPECT_TRUE(client.isRunning());
    EXPECT_EQ(tree.log.values.back().facts, Facts({{"source", "used.example"}})) << line;
  }
  tree.write("/known", "^,?,time.example,0,6,0,4294967295,0.0,0.0,0.0\n");
  EXPECT_TRUE(client.isRunning());
  EXPECT_EQ(tree.log.values.back().facts, Facts()) << "it has found none yet";
  std::filesystem::remove(tree.at("/known"));
  EXPECT_TRUE(client.isRunning());
  EXPECT_THAT(tree.log.values.back().facts.at(0).second, testing::StartsWith("not known: "));
}

TEST(LinuxNetworkTime, HasNotChangedWhileTheClientStartsOrStops) {
  for (const bool on : {true, false}) {
    ManagedTree tree;
    haveChrony(tree);
    tree.manager.set(chrony, {.active = on ? "inactive" : "active", .jobResult = ""});
    const FakeUnit late{.active = on ? "activating" : "deactivating", .jobResult = ""};
    const auto begins = tree.runLoop.after(std::chrono::milliseconds(50), [&] { tree.manager.set(chrony, late); });
    on ? tree.host().networkTime().start() : tree.host().networkTime().stop();
    EXPECT_THAT(tree.lastEffect(), FailedFor("its job has not ended in time"));
  }
}

TEST(LinuxNetworkTime, AsksForTheClientOnceWhenItLooksAtTheNextStart) {
  ManagedTree tree;
  haveChrony(tree);
  tree.manager.breakNext("ListUnitsByPatterns", FakeServiceManager::Fault::error);
  tree.host().networkTime().checkLaunchAtStartup(true);
  EXPECT_THAT(tree.lastEffect(), FailedFor("AccessDenied"));
}

TEST(LinuxNetworkTime, GoesByTheStartOfAClientThatDoesNotTellItsServers) {
  constexpr std::chrono::hours aWhile{1};
  LinuxTree tree;
  tree.haveInitScript("ntpsec", "ntpd");
  tree.write("/usr/sbin/ntpd", "");
  auto& client = tree.host().networkTime();
  client.setServer({"time.example"});
  client.start();
  tree.write("/run/ntpd.pid", "77");
  const auto now = std::filesystem::last_write_time(tree.at("/run/ntpd.pid"));
  for (const bool isRead : {true, false}) {
    std::filesystem::last_write_time(tree.at("/run/ntpd.pid"), isRead ? now + aWhile : now - aWhile);
    client.setServer({"time.example"});
    client.restartAsynchronously();
    EXPECT_EQ(tree.lastEffect().outcome == Outcome::unchanged, isRead);
  }
}

TEST(LinuxNetworkTime, TakesBackAServerThatALaterFileHides) {
  ManagedTree tree;
  constexpr const char* own = "/etc/systemd/timesyncd.conf.d/60-tavisk.conf";
  tree.manager.set("systemd-timesyncd.service", {});
  tree.write("/etc/systemd/timesyncd.conf", "[Time]\nNTP=a.example time.example b.example\n");
  tree.write("/etc/systemd/timesyncd.conf.d/70.conf", "[Time]\nNTP=c.example\n");
  auto& client = tree.host().networkTime();
  client.setServer({"time.example"});
  EXPECT_EQ(tree.lastEffect().where, own);
  EXPECT_EQ(tree.lastEffect().note,
            "puts aside what is configured elsewhere: a.example, b.example; configured elsewhere, stays in use behind "
            "it: c.example");
  const auto before = tree.file(own);
  tree.write("/etc/systemd/timesyncd.conf.d/70.conf", "[Time]\nNTP=\nNTP=c.example\n");
  for (const auto& kept : {before, std::string()}) {
    if (kept.empty()) std::filesystem::remove(tree.at(own));
    client.setServer({"next.example"});
    EXPECT_THAT(tree.lastEffect(), FailedFor("reads c.example, not as " + std::string(own)));
    EXPECT_FALSE(tree.lastEffect().changed);
    EXPECT_EQ(tree.lastEffect().where, "");
    EXPECT_EQ(tree.has(own) ? tree.file(own) : "", kept);
  }
}

TEST_F(ChronyTest, GoesBackToTheServersOfOthers) {
  constexpr const char* files[] = {"/etc/chrony/sources.d/60-tavisk.sources", "/etc/ntpsec/ntp.d/60-tavisk.conf",
                                   "/etc/systemd/timesyncd.conf.d/60-tavisk.conf"};
  tree.write("/etc/openntpd/ntpd.conf", "servers pool.example\n");
  tree.write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\npool pool.example iburst\n");
  for (const bool isRunning : {false, true}) {
    for (const auto* file : files) tree.write(file, "server time.example iburst prefer\n");
    if (isRunning) client.start();
    tree.log.effects.clear();
    tree.host().resets().reset(setting::networkTimeServer);
    ASSERT_EQ(tree.log.effects.size(), isRunning ? 2U : 1U);
    const auto& reset = tree.log.effects.front();
    EXPECT_EQ(reset.outcome, Outcome::applied);
    EXPECT_EQ(reset.before, "time.example");
    EXPECT_EQ(reset.stored, "pool.example");
    EXPECT_EQ(reset.where, commaList({std::begin(files), std::end(files)}));
    for (const auto* file : files) EXPECT_FALSE(tree.has(file)) << file;
    EXPECT_EQ(tree.has("/reloaded"), isRunning);
  }
  EXPECT_TRUE(tree.has("/etc/openntpd/ntpd.conf")) << "it is the administrator's";
  tree.host().resets().reset(setting::networkTimeServer);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::unchanged);
}

TEST_F(ChronyTest, ReadsItsServersWhereAResetWasCutShort) {
  constexpr const char* mark = "/run/tavisk/resets/Network Time Server";
  tree.write("/etc/chrony/chrony.conf", "pool pool.example iburst\n");
  client.start();
  tree.write(mark, "");
  tree.host().resets().reset(setting::networkTimeServer);
  EXPECT_TRUE(tree.has("/reloaded"));
  EXPECT_FALSE(tree.has(mark));
}

TEST_F(ChronyTest, NamesTheOwnFileThatWhoeverIsNotRootWouldRemove) {
  constexpr const char* own = "/etc/ntpsec/ntp.d/60-tavisk.conf";
  tree.write("/run/tavisk/lock", "");
  tree.write(own, "server time.example iburst prefer\n");
  const AsMember member(tree);
  tree.host().resets().reset(setting::networkTimeServer);
  EXPECT_THAT(tree.lastEffect(), FailedFor("remove on " + std::string(own) + ": needs root"));
  EXPECT_TRUE(tree.has(own));
}

TEST_F(ChronyTest, WritesNoServerThatTheClientDoesNotRead) {
  client.setServer({"time.example"});
  tree.write("/etc/chrony/chrony.conf", "pool pool.example iburst\n");
  client.setServer({"other.example"});
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("sourcedir"));
  EXPECT_EQ(client.server().address, "pool.example") << "chronyd does not read the tool's own file any more";
  std::filesystem::remove(tree.at("/etc/chrony/chrony.conf"));
  tree.link("/etc/chrony/chrony.conf", "chrony.conf");
  client.setServer({"other.example"});
  EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links")) << "whether it reads it is not known";
  EXPECT_EQ(client.server().address, "");
  EXPECT_THAT(tree.lastEffect(), FailedFor("/etc/chrony/chrony.conf"));
}

TEST_F(ChronyTest, TellsWhenSuccessChangedNothing) {
  for (const auto& [script, why] : {std::pair("#!/bin/sh\nexit 0\n", "chronyd does not run"),
                                    std::pair("#!/bin/sh\necho no such key >&2\nexit 3\n", "status 3: no such key")}) {
    tree.writeProgram("/etc/init.d/chrony", script);
    client.start();
    EXPECT_THAT(tree.lastEffect(), FailedFor(why));
  }
}

TEST_F(ChronyTest, IsNotTurnedOnUntilTheNextStartOnlyByWhoIsNotRoot) {
  tree.write("/run/tavisk/lock", "");
  const AsMember member(tree);
  client.start();
  EXPECT_THAT(tree.lastEffect(), FailedFor("enable on chrony.service: needs root: sudo tavisk"));
}

struct ServerFiles {
  std::vector<std::pair<const char*, const char*>> files;
  const char* servers;
};

/// What the daemon that starts with this program answers as its servers.
std::string serversOf(const char* program, const ServerFiles& configured) {
  LinuxTree tree;
  for (const auto& [path, text] : configured.files) tree.write(path, text);
  for (const auto& client : timeDaemons())
    if (std::string_view(client.daemon.program) == program) return commaList(*client.servers(tree.root));
  return "no such program";
}

TEST(TimeDaemons, ReadServersAsChronydDoes) {
  constexpr const char* main = "/etc/chrony/chrony.conf";
  const ServerFiles cases[] = {
      {{{main, "# server no.example\n! pool no.example\nPool  2.example iburst\nserver 3.example\n"}},
       "2.example, 3.example"},
      {{{main, "confdir /etc/chrony/conf.d\npool last.example"},
        {"/etc/chrony/conf.d/b.conf", "server b.example\n"},
        {"/etc/chrony/conf.d/a.txt", "server a.example\n"}},
       "b.example, last.example"},
      {{{main, "sourcedir /run/chrony-dhcp /etc/chrony/sources.d\n"},
        {"/etc/chrony/sources.d/20.sources", "server z.example\n"},
        {"/etc/chrony/sources.d/60-tavisk.sources", "server own.example iburst\n"}},
       "own.example, z.example"},
      {{{main, "server\n\n"}}, ""},
  };
  for (const auto& each : cases) EXPECT_EQ(serversOf("chronyd", each), each.servers) << each.files[0].second;
}

TEST(TimeDaemons, ReadServersAsTimesyncdDoes) {
  constexpr const char* main = "/etc/systemd/timesyncd.conf";
  constexpr const char* own = "/etc/systemd/timesyncd.conf.d/60-tavisk.conf";
  const ServerFiles cases[] = {
      {{{main, "[Time]\n#NTP=no.example\nFallbackNTP=no.example\n"}}, ""},
      {{{main, "[Other]\nNTP=no.example\n[Time]\n NTP = a.example  b.example\nNTP=c.example\n"}},
       "a.example, b.example, c.example"},
      {{{main, "[Time]\nNTP=a.example\n"}, {own, "[Time]\nNTP=\nNTP=own.example\n"}}, "own.example"},
      {{{main, "[Time]\nNTP=a.example\n"}, {"/run/systemd/timesyncd.conf.d/9.conf", "[Time]\nNTP=\n"}}, ""},
      {{{own, "[Time]\nNTP=own.example\n"}, {"/usr/lib/systemd/timesyncd.conf.d/60-tavisk.conf", "[Time]\nNTP=x\n"}},
       "own.example"},
      {{{own, "[Time]\nNTP=own.example\n"}, {"/usr/lib/systemd/timesyncd.conf.d/70.conf", "[Time]\nNTP=\nNTP=x\n"}},
       "x"},
      {{{main, "[Time]\nNTP=\\\n; a comment between\na.example\n"}}, "a.example"},
      {{{"/usr/lib/systemd/timesyncd.conf", "[Time]\nNTP=vendor.example"}}, "vendor.example"},
  };
  for (const auto& each : cases) EXPECT_EQ(serversOf("systemd-timesyncd", each), each.servers) << each.files[0].second;
}

TEST(TimeDaemons, ReadServersAsNtpdDoes) {
  constexpr const char* main = "/etc/ntpsec/ntp.conf";
  const ServerFiles cases[] = {
      {{{main, "driftfile /x\npool 0.example iburst\n"}, {"/etc/ntpsec/ntp.d/1.conf", "server 1.example\n"}},
       "0.example, 1.example"},
      {{{main, "tos maxclock 11\n"}, {"/etc/ntpsec/ntp.d/1.conf", "server 1.example\n"}}, "1.example"},
      {{{main, "pool 0.example\n"}, {"/etc/ntpsec/ntp.d/60-tavisk.conf", "server own.example iburst\n"}},
       "own.example, 0.example"},
  };
  for (const auto& each : cases) EXPECT_EQ(serversOf("ntpd", each), each.servers) << each.files[0].second;
}

TEST(LinuxNetworkTime, KnowsTheClientThatIsReallyThereAndLeavesItsFileAlone) {
  LinuxTree tree;
  EXPECT_FALSE(tree.host().networkTime().isRunning());
  EXPECT_EQ(tree.host().networkTime().server().address, "");
  tree.host().networkTime().start();
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("none of them is installed"));
  tree.writeProgram("/etc/init.d/chrony", "#!/bin/sh\n");  // all that is left of a package
  tree.writeProgram("/etc/init.d/openntpd", "#!/bin/sh\n");
  tree.writeProgram("/usr/sbin/ntpd", "");
  tree.write("/etc/openntpd/ntpd.conf", "listen on *\nservers pool.example weight 5\n");
  tree.host().networkTime().setServer({"time.example"});
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("/etc/openntpd/ntpd.conf"));
  EXPECT_EQ(tree.host().networkTime().server().address, "pool.example");
}

}  // namespace
}  // namespace tavisk
