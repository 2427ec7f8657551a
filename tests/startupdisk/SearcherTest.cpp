// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <atomic>
#include <thread>

#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

TEST(Searcher, NeedsADelegate) {
  StartupMachine machine;
  const SearcherServices services{machine.host().diskManagement(), machine.host().files(), machine.runLoop,
                                  machine.environment().log};
  EXPECT_FALSE(SDSystemSearcher::initWithDelegate(nullptr, false, true, false, services));
  EXPECT_THAT(machine.systemLog(),
              ElementsAre("-[SDSystemSearcher initWithDelegate:onOldWorld:canBootNative9:canBootLegacyOS:] "
                          "Delegate should not be nil!"));
}

TEST(Searcher, ReportsInALaterPassUnlessItIsGone) {
  StartupMachine machine;
  machine.addLumaraX("disk0s2", "V");
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, false);
  searcher->searchForSystemOnVolume(machine.volume("disk0s2"));
  EXPECT_EQ(delegate.activities, 0);
  EXPECT_TRUE(delegate.found.empty());
  machine.runPasses(1);
  EXPECT_EQ(delegate.activities, 2) << "its creation, and the search";
  EXPECT_EQ(delegate.found.size(), 1U);
  EXPECT_EQ(delegate.completions, 0);
  machine.searcher(delegate, false)->searchForSystemOnVolume(machine.volume("disk0s2"));
  machine.runPasses(2);
  EXPECT_EQ(delegate.activities, 2);
  EXPECT_EQ(delegate.found.size(), 1U);
}

TEST(Searcher, KeepsVolumesUntilTheyAreWithdrawn) {
  StartupMachine machine;
  machine.addVolume("disk0s2", "V");
  machine.addVolume("disk1s2", "W");
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, false);
  const auto twice = machine.volume("disk0s2");
  for (const auto& volume : {machine.volume("disk1s2"), twice, twice, machine.volume("disk0s2")})
    searcher->searchForSystemOnVolume(volume);
  const std::pair<const char*, std::size_t> withdrawals[] = {{"disk9s2", 4}, {"disk0s2", 2}, {"disk0s2", 1},
                                                             {"disk0s2", 1}, {"disk1s2", 0}, {"disk1s2", 0}};
  for (const auto& [disk, left] : withdrawals) {
    searcher->cancelSearchOnVolume(*machine.volume(disk));
    EXPECT_EQ(searcher->waitingVolumes(), left) << disk;
  }
}

TEST(Searcher, WithdrawsARecordByTheDiskThatItIsNow) {
  StartupMachine machine;
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, false);
  const auto changed = machine.volume("disk0s2");
  for (const auto& volume : {changed, machine.volume("disk2s2")}) searcher->searchForSystemOnVolume(volume);
  changed->setDisk(DiskName{"disk1s2"});
  for (const auto& [disk, left] : {std::pair("disk0s2", 2U), std::pair("disk1s2", 1U)}) {
    searcher->cancelSearchOnVolume(*machine.volume(disk));
    EXPECT_EQ(searcher->waitingVolumes(), left) << disk;
  }
  searcher->_searchOldestVolume();
  EXPECT_EQ(searcher->waitingVolumes(), 0U);
}

/// A worker for the long search, on a thread of the test's own.
class Worker {
 public:
  explicit Worker(SDSystemSearcher& searcher, SDDiskRef last)
      : _searcher(searcher), _last(std::move(last)), _thread([this] {
          while (!_ends) _searcher._searchOldestVolume();
        }) {}
  /// One more volume wakes a worker that sleeps.
  ~Worker() {
    _ends = true;
    _searcher.setSearchPaused(false);
    _searcher.searchForSystemOnVolume(_last);
    _thread.join();
  }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

 private:
  SDSystemSearcher& _searcher;
  SDDiskRef _last;
  std::atomic<bool> _ends = false;
  std::thread _thread;
};

/// The volumes of two Windows systems and of a disc, which wait for the long search in this order: A, B, C.
class WaitingVolumes {
 public:
  WaitingVolumes() {
    const auto disc = keys({{"Kind", "cd9660"}, {"Optical", true}, {"Optical Bootable", true}});
    machine.addVolume("disk0s1", "A", keys({{"Kind", "ntfs"}}));
    machine.addVolume("disk1", "B", disc);
    machine.addVolume("disk2s1", "C", keys({{"Kind", "msdos"}}));
    for (const char* volume : {"A", "C"}) machine.writeFile("/Volumes/" + std::string(volume) + "/SYSTEM.INI", "");
    for (const char* disk : {"disk0s1", "disk1", "disk2s1"}) searcher->searchForSystemOnVolume(machine.volume(disk));
  }
  bool findsAll() {
    const auto deadline = RunLoop::Clock::now() + std::chrono::seconds(30);
    return machine.runLoop.runUntil(deadline, [&] { return delegate.found.size() == 3; });
  }
  std::vector<std::string> found() const {
    std::vector<std::string> found;
    for (const auto& system : delegate.found)
      found.push_back(system->description() + *system->textForKey(recordkey::systemFolderPath));
    return found;
  }

  StartupMachine machine;
  RecordingDelegate delegate;
  const std::unique_ptr<SDSystemSearcher> searcher = machine.searcher(delegate, true);
};

TEST(Searcher, AWorkerSearchesTheRootsOfVolumesOldestFirst) {
  WaitingVolumes volumes;
  const Worker worker(*volumes.searcher, volumes.machine.volume("disk9"));
  volumes.searcher->cancelSearchOnVolume(*volumes.machine.volume("disk8"));  // beside the worker
  ASSERT_TRUE(volumes.findsAll());
  const auto found = volumes.found();
  EXPECT_THAT(found, testing::UnorderedElementsAre("disk0s1 A/Volumes/A", "disk1 B/Volumes/B", "disk2s1 C/Volumes/C"));
  EXPECT_LT(std::ranges::find(found, "disk0s1 A/Volumes/A"), std::ranges::find(found, "disk2s1 C/Volumes/C"));
}

TEST(Searcher, APauseStopsAWorkerBeforeItsNextVolume) {
  WaitingVolumes volumes;
  volumes.machine.runPasses(1);
  volumes.searcher->setSearchPaused(true);
  const auto activities = volumes.delegate.activities;
  const Worker worker(*volumes.searcher, volumes.machine.volume("disk9"));
  const auto deadline = RunLoop::Clock::now() + std::chrono::seconds(30);
  // It tells that it has taken the first volume, and then stands before the gate.
  EXPECT_TRUE(volumes.machine.runLoop.runUntil(
      deadline, [&] { return volumes.searcher->waitingVolumes() == 2 && volumes.delegate.activities > activities; }));
  volumes.machine.runPasses(2);
  EXPECT_EQ(volumes.searcher->waitingVolumes(), 2U);
  EXPECT_THAT(volumes.found(), testing::IsEmpty());
  volumes.searcher->setSearchPaused(false);
  EXPECT_TRUE(volumes.findsAll());
}

}  // namespace
}  // namespace tavisk
