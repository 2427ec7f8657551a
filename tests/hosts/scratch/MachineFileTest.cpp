// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <signal.h>
#include <sys/file.h>
#include <sys/wait.h>
#include <unistd.h>

#include "OwnMounts.h"
#include "ScratchMachine.h"
#include "effects/EffectLog.h"
#include "hosts/scratch/MachineFile.h"

namespace tavisk {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class MachineFileTest : public testing::Test {
 protected:
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
  using Dictionary = PropertyList::Dictionary;
  auto nested = [](std::initializer_list<const char*> keys, PropertyList value) {
    for (auto key = std::rbegin(keys); key != std::rend(keys); ++key) {
      Dictionary outer;
      outer.set(*key, std::move(value));
      value = std::move(outer);
    }
    return value;
  };
  PropertyList::Array mixed{PropertyList(1), PropertyList("two")};
  PropertyList::Array signals{nested({"Process"}, 1), nested({"Process"}, "sshd")};
  const std::pair<PropertyList, const char*> cases[] = {
      {nested({"Clock"}, "noon"), R"("Clock": expected a dictionary)"},
      {nested({"Clock", "Time"}, "noon"), R"("Clock" "Time": expected an integer)"},
      {nested({"Network Time", "Running"}, 1), R"("Network Time" "Running": expected a boolean)"},
      {nested({"Refusals", "Time"}, true), R"("Refusals" "Time": expected a string)"},
      {nested({"User", "Groups"}, mixed), R"("User" "Groups": expected an array of integers)"},
      {nested({"Clock", "Known Time Zones"}, mixed), R"("Clock" "Known Time Zones": expected an array of strings)"},
      {nested({"User Defaults", "SDWirestartScanInterval"}, "1"),
       R"("User Defaults" "SDWirestartScanInterval": expected a number)"},
      {nested({"Power Sources", "AC Power", "Wake On LAN"}, 1),
       R"("Power Sources" "AC Power" "Wake On LAN": expected a boolean)"},
      {nested({"Registry", "Device Tree", "/pci/eth", "mac"}, "00"),
       R"("Registry" "Device Tree" "/pci/eth" "mac": expected data)"},
      {nested({"Firmware", "Boot Preference", "Lumara 9"}, 9),
       R"("Firmware" "Boot Preference" "Lumara 9": expected a boolean)"},
      {nested({"Signals"}, mixed), R"("Signals": expected an array of dictionaries)"},
      {nested({"Signals"}, signals), R"("Signals" 2 "Process": expected an integer)"},
      {PropertyList("machine"), "expected a dictionary"},
      {nested({"Registry", "Services", "BMC", "ServerID"}, "x"), nullptr},
      {nested({"Unknown", "Time"}, "noon"), nullptr},
      {nested({"User Defaults", "SDWirestartScanInterval"}, 1), nullptr},
  };
  for (const auto& [list, why] : cases) {
    machine.describe(*writePropertyList(list));
    EXPECT_EQ(whyNotOpened(), why ? path() + ": " + why : "opened");
  }
}

TEST_F(MachineFileTest, refusesWhatIsNoPropertyList) {
  for (const char* text : {"", "<plist><dict>"}) {
    machine.describe(text);
    EXPECT_THAT(whyNotOpened(), HasSubstr("/machine.plist: "));
  }
}

TEST_F(MachineFileTest, refusesALinkThatLeadsNowhere) {
  std::filesystem::create_symlink("../elsewhere", path());
  EXPECT_EQ(whyNotOpened(), path() + ": No such file or directory");
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

TEST_F(MachineFileTest, standsAtTheLastGoodContentsAndSaysSoOnce) {
  machine.set("Clock", "Offset", 1);
  const auto file = open();
  machine.describe("<plist><dict>");
  for (int times = 0; times < 3; ++times) EXPECT_EQ(file->section("Clock").integer("Offset"), 1);
  ASSERT_EQ(machine.log.effects.size(), 1U);
  EXPECT_EQ(machine.log.effects[0].failure->on, path());
  EXPECT_EQ(machine.log.effects[0].note, "the contents last read stand");
  machine.describe(plist("<dict/>"));
  EXPECT_EQ(file->section("Clock").integer("Offset"), 0);
}

TEST_F(MachineFileTest, isNotReplacedWhileItCannotBeRead) {
  const auto file = open();
  machine.describe("<plist><dict>");
  EXPECT_EQ(file->change(countTwice()).failure().on, path());
  EXPECT_EQ(contentsOf(path()), "<plist><dict>");
}

/// What an observer is told: how many sections there were before and after each change.
class ObservedMachineTest : public MachineFileTest {
 protected:
  void observe() {
    observation = file->observeChanges(machine.runLoop, told, [this](const auto& before, const auto& now) {
      changes.emplace_back(before->size(), now->size());
    });
  }
  bool isTold() {
    return machine.runLoop.runUntil(RunLoop::Clock::now() + 5s, [&] { return !changes.empty(); });
  }

  std::unique_ptr<MachineFile> file = open();
  MachineFile::Contents told = file->contents();
  RunLoop::Registration observation;
  std::vector<std::pair<std::size_t, std::size_t>> changes;
};

TEST_F(ObservedMachineTest, tellsWhatChangedBeforeTheObservationBegan) {
  machine.set("Clock", "Time", 1);
  observe();
  EXPECT_TRUE(isTold());
  EXPECT_THAT(changes, ElementsAre(std::pair(0, 1)));
}

TEST_F(ObservedMachineTest, tellsWhatOthersChangeOnceItCanBeRead) {
  observe();
  machine.runLoop.runPass();
  machine.describe("not yet");
  machine.runLoop.runPass();
  machine.describe(plist("<dict><key>Mine</key><true/></dict>"));
  EXPECT_TRUE(isTold());
  EXPECT_THAT(changes, ElementsAre(std::pair(0, 1)));
}

TEST_F(ObservedMachineTest, tellsNothingOfOtherFilesNorAfterItsEnd) {
  observe();
  machine.host().systemLog().write("no change of the machine");
  machine.runLoop.runPass();
  observation.cancel();
  machine.set("Clock", "Time", 1);
  machine.runLoop.runPass();
  EXPECT_THAT(changes, IsEmpty());
}

TEST_F(MachineFileTest, losesNothingBetweenTwoProcesses) {
  constexpr int changes = 60;
  auto work = [&] {
    auto file = open();
    for (int times = 0; times < changes; ++times) {
      if (!file->change(countTwice())) ::_exit(1);
    }
  };
  auto children = {inAnotherProcess(work), inAnotherProcess(work)};
  for (auto child : children) {
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_EQ(status, 0);
  }
  EXPECT_EQ(machine.get("Counts", "One"), PropertyList(2 * changes));
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

/// Another run that keeps the machine locked.
class LockedMachineTest : public MachineFileTest {
 protected:
  LockedMachineTest() : other(::open((machine.directory() + "/machine.lock").c_str(), O_RDONLY | O_CREAT, 0644)) {
    EXPECT_EQ(::flock(other.number(), LOCK_EX), 0);
  }
  FileDescriptor other;
};

TEST_F(LockedMachineTest, isWaitedFor) {
  const auto file = open();
  std::thread release([&] {
    std::this_thread::sleep_for(100ms);
    ::flock(other.number(), LOCK_UN);
  });
  EXPECT_TRUE(file->change(countTwice()));
  release.join();
}

TEST_F(LockedMachineTest, isNotWaitedForLongOnOtherThreads) {
  const auto file = open();
  std::thread([&] {
    const auto before = RunLoop::Clock::now();
    EXPECT_THAT(file->change(countTwice()).failure().why, HasSubstr("another run"));
    EXPECT_LT(RunLoop::Clock::now() - before, 2s);
  }).join();
}

/// Does the work on a machine in a file system of its own, and tells the host's effects there.
void withSmallMachine(const ScratchMachine& machine, const std::function<void(Host& host, EffectLog& told)>& work) {
  const bool ran = withOwnMounts([&] {
    ASSERT_TRUE(mountMemory(machine.directory(), "64k"));
    EffectSink effects;
    EffectLog told;
    effects.addChannel(told);
    RunLoop runLoop;
    const auto host = ScratchHost::open(machine.directory(), effects, runLoop);
    work(**host, told);
  });
  if (!ran) GTEST_SKIP() << "may not have mounts of its own";
}

TEST_F(MachineFileTest, saysWhenThereIsNoRoomForAChange) {
  withSmallMachine(machine, [](Host& host, EffectLog& told) {
    host.networkTime().setServer({"old.example"});
    host.networkTime().setServer({std::string(70'000, 'x')});
    EXPECT_EQ(told.effects.back().failure->code, std::errc::no_space_on_device);
    EXPECT_EQ(host.networkTime().server().address, "old.example");
  });
}

TEST_F(MachineFileTest, saysWhenItMayNotBeWritten) {
  withSmallMachine(machine, [&](Host& host, EffectLog& told) {
    ASSERT_EQ(::mount("", machine.directory().c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0);
    host.networkTime().start();
    EXPECT_EQ(told.effects.back().failure->code, std::errc::read_only_file_system);
    EXPECT_FALSE(host.networkTime().isRunning());
  });
}

TEST_F(MachineFileTest, leavesNoHalfLineInTheSystemLog) {
  withSmallMachine(machine, [&](Host& host, EffectLog& /*told*/) {
    for (const auto& message : {std::string("first"), std::string(70'000, 'x'), std::string("last")})
      host.systemLog().write(message);
    EXPECT_THAT(machine.systemLog(), ElementsAre("first", "last"));
  });
}

}  // namespace
}  // namespace tavisk
