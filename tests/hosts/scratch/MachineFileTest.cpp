// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

#include <set>

#include "OwnMounts.h"
#include "ScratchMachine.h"
#include "base/Keys.h"
#include "base/Text.h"
#include "effects/EffectMatchers.h"
#include "hosts/scratch/KeyTable.h"
#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/Misspellings.h"

namespace tavisk {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::HasSubstr;

TEST(KeyTable, hasEachKeyOnceInAPlaceThatItHasToo) {
  std::set<std::string> known{""};
  for (const auto& row : keyTable()) {
    EXPECT_TRUE(known.contains(std::string(row.place))) << row.place;
    const auto key = placeUnder(row);
    EXPECT_TRUE(known.insert(key).second) << key;
    if (row.type == KeyType::dictionaries) known.insert(key + "/*");
  }
}

TEST(Misspellings, areNamesThatAreLikeAKnownOneAndRefusalsOfNoSetting) {
  const std::tuple<const char*, const char*> cases[] = {
      {"Clock|TimeZone", R"-("Clock" "TimeZone" (is "Time Zone" meant?))-"},
      {"clock|Time Zone", R"-("clock" (is "Clock" meant?))-"},
      {"Power Sources|AC Power|Wake on Lan", R"-("Power Sources" "AC Power" "Wake on Lan" (is "Wake On LAN" meant?))-"},
      {"Disks|disk0|Mountpoint", R"-("Disks" "disk0" "Mountpoint" (is "Mount Point" meant?))-"},
      {"Disks|disk0|CDs", nullptr},
      {"Clock|Remark", nullptr},
      {"Preferences|Clocks", nullptr},
      {"Refusals|Time zone", R"-("Refusals" "Time zone" (is "Time Zone" meant?))-"},
      {"Refusals|Sleep (read)", R"-("Refusals" "Sleep (read)" (no setting is called so))-"},
      {"Refusals|* (read)", nullptr},
      {"Refusals|Time Zone (read)", nullptr},
      {"Refusals|Firmware Variable boot-args", nullptr},
  };
  for (const auto& [place, told] : cases) {
    auto machine = PropertyList("no");
    const auto names = split(place, "|");
    for (auto name = names.rbegin(); name != names.rend(); ++name) machine = keys({{*name, machine}});
    EXPECT_EQ(misspeltNames(*machine.asDictionary()),
              told ? std::vector<std::string>{told} : std::vector<std::string>{});
  }
  const auto signals = keys({{"Signals", PropertyList::Array{keys({{"Proces", 1}})}}});
  EXPECT_THAT(misspeltNames(signals), ElementsAre(HasSubstr("\"Process\"")));
}

struct MachineFileTest : testing::Test {
  std::unique_ptr<MachineFile> open() {
    auto file = MachineFile::open(machine.directory(), machine.effects);
    EXPECT_TRUE(file) << file.failure().why;
    return std::move(file).value();
  }
  std::string path() const { return machine.directory() + "/machine.plist"; }
  std::string whyNotOpened() {
    auto file = MachineFile::open(machine.directory(), machine.effects);
    return file ? "opened" : file.failure().on + ": " + file.failure().why;
  }
  /// The process that the work is done in.
  pid_t inAnotherProcess(const std::function<void()>& work) {
    auto child = ::fork();
    if (child != 0) return child;
    work();
    ::_exit(0);
  }
  std::vector<std::string> names() { return SystemRoot(machine.directory()).list("/").valueOr({}); }

  ScratchMachine machine;
};

MachineFile::Edit countTwice(int times = 1) {
  return [times](MachineFile::Dictionary& values) {
    auto& counts = values.dictionary("Counts");
    for (const char* key : {"One", "Two"}) {
      const auto* count = counts.find(key);
      counts.set(key, (count ? *count->asInteger() : 0) + times);
    }
  };
}

std::string plist(const std::string& inside) {
  return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n" + inside + "</plist>\n";
}

TEST_F(MachineFileTest, refusesValuesOfAWrongTypeByFileKeyAndExpectation) {
  const PropertyList::Array mixed{PropertyList(1), PropertyList("two")};
  const std::tuple<const char*, PropertyList, const char*> cases[] = {
      {"Clock", "noon", ": expected a dictionary"},
      {"Clock|Time", "noon", ": expected an integer"},
      {"Network Time|Running", 1, ": expected a boolean"},
      {"Refusals|Time", true, ": expected a string"},
      {"User|Groups", mixed, ": expected an array of integers"},
      {"Clock|Known Time Zones", mixed, ": expected an array of strings"},
      {"User Defaults|SDWirestartScanInterval", "1", ": expected a number"},
      {"Power Sources|AC Power|Wake On LAN", 1, ": expected a boolean"},
      {"Registry|Device Tree|/pci/eth|mac", "00", ": expected data"},
      {"Firmware|Boot Preference|Lumara 9", 9, ": expected a boolean"},
      {"Signals", mixed, ": expected an array of dictionaries"},
      {"Signals", PropertyList::Array{keys({{"Process", 1}}), keys({{"Process", "sshd"}})},
       " 2 \"Process\": expected an integer"},
      {"Registry|Services|BMC|ServerID", "x", nullptr},
      {"Unknown|Time", "noon", nullptr},
      {"User Defaults|SDWirestartScanInterval", 1, nullptr},
  };
  for (const auto& [place, value, why] : cases) {
    auto list = value;
    std::string where;
    const auto names = split(place, "|");
    for (const auto& key : names) where += " \"" + key + "\"";
    for (auto key = names.rbegin(); key != names.rend(); ++key) list = keys({{*key, list}});
    machine.describe(*writePropertyList(list));
    EXPECT_EQ(whyNotOpened(), why ? path() + ":" + where + why : "opened");
  }
}

TEST_F(MachineFileTest, refusesALinkThatLeadsNowhereAndWhatIsNoPropertyListOfADictionary) {
  std::filesystem::create_symlink("../elsewhere", path());
  EXPECT_EQ(whyNotOpened(), path() + ": No such file or directory");
  std::filesystem::remove(path());
  for (const auto& text : {std::string(), std::string("<plist><dict>"), plist("<string>machine</string>")}) {
    machine.describe(text);
    EXPECT_THAT(whyNotOpened(), HasSubstr("/machine.plist: "));
  }
}

TEST_F(MachineFileTest, refusesWhatIsNoFolder) {
  for (const auto& [name, error] : {std::pair("/no/such", ENOENT), {"/etc/passwd", ENOTDIR}})
    EXPECT_EQ(MachineFile::open(name, machine.effects).failure(), systemFailure("rehearse", name, error));
}

TEST_F(MachineFileTest, keepsUnknownKeysAndTheOrderOfAll) {
  const std::string before =
      "\t<key>Zebra</key>\n\t<array>\n\t\t<real>1.5</real>\n\t\t<data>AAE=</data>\n\t</array>\n"
      "\t<key>Clock</key>\n\t<dict>\n\t\t<key>Time Zone</key>\n\t\t<string>a &amp; b</string>\n"
      "\t\t<key>Mine</key>\n\t\t<date>2006-12-25T00:00:00Z</date>\n\t\t<key>Time</key>\n\t\t<integer>";
  const std::string after = "</integer>\n\t</dict>\n\t<key>Apple</key>\n\t<true/>\n";
  machine.describe(plist("<dict>\n" + before + "1" + after + "</dict>\n"));
  EXPECT_TRUE(open()->change([](auto& values) { values.dictionary("Clock").set("Time", 2); }));
  auto text = contentsOf(path());
  EXPECT_THAT(text, HasSubstr("<dict>\n" + before + "2" + after + "</dict>\n"));
}

TEST_F(MachineFileTest, isReadAgainOnlyWhenItChanged) {
  machine.set("Clock", "Time", 1);
  auto file = open();
  auto wakeUp = machine.runLoop.every(5ms, [] {});
  auto isKept = [&] { return file->contents() == file->contents(); };
  EXPECT_TRUE(machine.runLoop.runUntil(RunLoop::Clock::now() + 5s, isKept));
  for (int time = 2; time < 30; ++time) {
    machine.set("Clock", "Time", time % 10);
    ASSERT_EQ(*file->section("Clock").find("Time"), PropertyList(time % 10)) << "of one size, in quick succession";
  }
}

TEST_F(MachineFileTest, mayBeALinkInsideItsFolder) {
  machine.set("Clock", "Offset", 1);
  std::filesystem::rename(path(), machine.directory() + "/real");
  std::filesystem::create_symlink("/real", path());
  auto file = open();
  EXPECT_EQ(file->section("Clock").integer("Offset"), 1);
  EXPECT_TRUE(file->change([](auto& values) { values.dictionary("Clock").set("Offset", 2); }));
  EXPECT_EQ(file->section("Clock").integer("Offset"), 2);
  EXPECT_THAT(names(), ElementsAre("machine.lock", "machine.plist", "real"));
}

TEST_F(MachineFileTest, standsAtTheLastGoodContentsSaysSoOnceAndIsNotReplaced) {
  machine.set("Clock", "Offset", 1);
  const auto file = open();
  machine.describe("<plist><dict>");
  for (int times = 0; times < 3; ++times) EXPECT_EQ(file->section("Clock").integer("Offset"), 1);
  ASSERT_EQ(machine.log.effects.size(), 1U);
  EXPECT_EQ(machine.log.effects[0].failure->on, path());
  EXPECT_EQ(machine.log.effects[0].note, "the contents last read stand");
  EXPECT_EQ(file->change(countTwice()).failure().on, path());
  EXPECT_EQ(contentsOf(path()), "<plist><dict>");
  machine.describe(plist("<dict/>"));
  EXPECT_EQ(file->section("Clock").integer("Offset"), 0);
}

TEST_F(MachineFileTest, tellsAnObserverWhatChangedSinceItWasReadAndNothingOfOtherFilesNorAfterItsEnd) {
  const auto file = open();
  const auto told = file->contents();
  machine.set("Clock", "Time", 1);
  std::vector<std::pair<std::size_t, std::size_t>> changes;
  auto observation = file->observeChanges(machine.runLoop, told, [&](const auto& before, const auto& now) {
    changes.emplace_back(before->size(), now->size());
  });
  EXPECT_TRUE(machine.runLoop.runUntil(RunLoop::Clock::now() + 5s, [&] { return !changes.empty(); }));
  machine.host().systemLog().write("no change of the machine");
  machine.runLoop.runPass();
  observation.cancel();
  machine.set("Network Time", "Running", true);
  machine.runLoop.runPass();
  EXPECT_THAT(changes, ElementsAre(std::pair(0, 1)));
}

TEST_F(MachineFileTest, losesNothingBetweenTwoProcesses) {
  constexpr int changes = 60;
  auto work = [&](const std::string& name) {
    auto file = open();
    auto& bootLoader = machine.host().bootLoaderFile();
    for (int times = 0; times < changes; ++times) {
      if (!file->change(countTwice())) ::_exit(1);
      if (!bootLoader.write(keys({{name + std::to_string(times), true}}))) ::_exit(2);
    }
  };
  auto children = {inAnotherProcess([&] { work("one"); }), inAnotherProcess([&] { work("other"); })};
  for (auto child : children) {
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
  }
  EXPECT_EQ(machine.get("Counts", "One"), PropertyList(2 * changes));
  EXPECT_EQ((*machine.host().bootLoaderFile().read())->size(), 2U * changes);
}

TEST_F(MachineFileTest, isWholeWheneverItsWriterIsKilled) {
  for (int kills = 0; kills < 60; ++kills) {
    auto child = inAnotherProcess([&] {
      auto file = open();
      while (true) (void)file->change(countTwice());
    });
    ::usleep(static_cast<useconds_t>(3000 + 331 * kills % 4000));
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    ASSERT_EQ(whyNotOpened(), "opened");
    ASSERT_EQ(machine.get("Counts", "One"), machine.get("Counts", "Two"));
  }
  EXPECT_TRUE(open()->change(countTwice()));
  EXPECT_THAT(names(), ElementsAre("machine.lock", "machine.plist"));
}

TEST_F(MachineFileTest, isNotWaitedForLongOnOtherThreads) {
  const auto file = open();
  const FileDescriptor other(::open((machine.directory() + "/machine.lock").c_str(), O_RDONLY | O_CREAT, 0644));
  ASSERT_EQ(::flock(other.number(), LOCK_EX), 0);
  std::thread([&] {
    const auto before = RunLoop::Clock::now();
    EXPECT_THAT(file->change(countTwice()).failure().why, HasSubstr("another run"));
    EXPECT_LT(RunLoop::Clock::now() - before, 2s);
  }).join();
}

TEST_F(MachineFileTest, leavesNoHalfLineInTheSystemLog) {
  const bool ran = withOwnMounts([&] {
    ASSERT_TRUE(mountMemory(machine.directory(), "64k"));
    for (const auto& message : {std::string("first"), std::string(70'000, 'x'), std::string("last")})
      machine.host().systemLog().write(message);
    EXPECT_THAT(machine.systemLog(), ElementsAre("first", "last"));
  });
  if (!ran) GTEST_SKIP() << "may not have mounts of its own";
}

TEST_F(MachineFileTest, isNoEmptyMachineWhenItCannotBeLookedAt) {
  machine.set("Clock", "Time Zone", "UTC");
  const auto file = open();
  machine.set("Clock", "Time Zone", "GMT");
  const auto aside = machine.directory() + "/aside";
  std::filesystem::rename(path(), aside);
  std::filesystem::create_symlink("machine.plist", path());
  const auto zone = file->section("Clock").optionalText("Time Zone");
  std::filesystem::rename(aside, path());
  EXPECT_EQ(zone, "UTC") << "what was read last";
  EXPECT_THAT(machine.log.effects, ElementsAre(FailedFor("symbolic links")));
  EXPECT_EQ(file->section("Clock").text("Time Zone"), "GMT");
}

}  // namespace
}  // namespace tavisk
