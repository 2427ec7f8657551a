// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <cstdlib>
#include <ctime>

#include "startupdisk/StartupDisk.h"
#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::string systemFolder(const std::string& volume) {
  return "/Volumes/" + volume + coreServicesFolder;
}

TEST(Controller, IsOneAndKnowsTheMountedVolumesAtOnce) {
  StartupMachine machine;
  machine.addLumaraX("disk1s2", "B");
  machine.addLumaraX("disk0s2", "A");
  machine.addVolume("disk2s2", "Empty");
  machine.set("Disks", "disk3s2", keys({{"Volume Name", "Unmounted"}}));
  NotificationRecorder recorder(machine.notifications);
  StartupDisk run(machine.host(), machine.runLoop, machine.notifications);
  auto& controller = run.sharedController();
  EXPECT_EQ(&run.sharedController(), &controller);
  EXPECT_THAT(controller.foundSystemPathsForCache(), ElementsAre(systemFolder("B"), systemFolder("A")));
  EXPECT_THAT(recorder.take(),
              ElementsAre("SDBusySearching", "SDBusySearching", "SDBusySearching", "SDBusySearching", "SDBusySearching",
                          "SDBusySearching", "SDSystemDidAppear disk1s2 B", "SDSystemVolumeDidAppear disk1s2 B",
                          "SDBusySearching", "SDSystemDidAppear disk0s2 A", "SDSystemVolumeDidAppear disk0s2 A",
                          "SDBusySearching"))
      << "each volume is told, then each search, the searcher's own creation first";
  controller.searchCompleted();
  EXPECT_THAT(recorder.take(), ElementsAre("SDDoneSearching"));
}

TEST(Controller, PassesOverWhatCannotStartTheMachine) {
  const std::string mounted = "mountable disk appeared: /Volumes/V";
  const auto disc = [](int status, bool bootable) {
    return keys({{"Optical", true}, {"Optical Status", status}, {"Optical Bootable", bootable}});
  };
  const auto scheme = [](int code) { return keys({{"Scheme", code}}); };
  const std::string noDisk = "Disk disk0s2 V can not boot this machine, removing from list.";
  const std::string noDisc = "Optical disc disk0s2 V can not boot this machine, removing from list.";
  const std::string ignored = "Disk Image found, and ignored: disk0s2 /Volumes/V";
  const std::string kernel = "Found " + systemFolder("V") + "/mach_kernel";
  const std::vector<std::string> searched{mounted, "Found " + systemFolder("V") + "/boot.efi", kernel};
  const std::vector<std::string> searchedX{mounted, "Found " + systemFolder("V") + "/BootX", kernel};
  // The name, the firmware, the disk, and the log after the line of the appearance.
  const std::tuple<const char*, int, Keys, std::vector<std::string>> cases[] = {
      {"unmounted", 2, keys({{"Mount Point", ""}}), {}},
      {"disk image", 2, keys({{"Protocol", "Disk Image"}}), {mounted, ignored}},
      {"good disc", 2, disc(0, true), searched},
      {"disc of another machine", 2, disc(0, false), {mounted, noDisc}},
      {"unreadable disc", 2, disc(5, true), {mounted, noDisc}},
      {"0 and 0", 0, scheme(0), searchedX},
      {"0 and 1", 0, scheme(1), {mounted, noDisk}},
      {"0 and 2", 0, scheme(2), {mounted, noDisk}},
      {"1 and 1", 1, scheme(1), searchedX},
      {"1 and 2", 1, scheme(2), {mounted, noDisk}},
      {"2 and 1", 2, scheme(1), {mounted, noDisk}},
      {"2 and 3", 2, scheme(3), searched},
  };
  for (const auto& [name, firmware, disk, told] : cases) {
    SCOPED_TRACE(name);
    StartupMachine machine;
    machine.set("Firmware", "Pre-Boot Environment", firmware);
    machine.addLumaraX("disk0s2", "V", disk);
    machine.addLumaraX("disk1s2", "Network", keys({{"Network", true}}));
    machine.addLumaraX("disk2s2", "Raw", keys({{"Mountable", false}}));
    machine.debug();
    machine.haveDeviceTree("");
    machine.controller();
    auto log = machine.systemLog();
    ASSERT_EQ(log.front(), "-[SDController(VolumeEvents) _volumeAppeared:]: disk0s2 V isCDROM: 0 isDVDROM: 0");
    log.erase(log.begin());
    EXPECT_EQ(log, told);
  }
}

TEST(Controller, DropsTheSystemsOfAVolumeThatIsGoneOrCannotStartTheMachineAnyMore) {
  const auto mounted = keys({{"Volume Name", "A"}, {"Mount Point", "/Volumes/A"}});
  StartupMachine machine;
  machine.addLumaraX("disk0s2", "A");
  machine.addLumaraX("disk1s2", "B");
  machine.controller();
  NotificationRecorder recorder(machine.notifications);
  for (const auto& [key, value] : keys({{"Mount Point", ""}, {"Mountable", false}, {"Network", true}})) {
    auto stopped = mounted;
    stopped.set(key, value);
    machine.set("Disks", "disk0s2", stopped);
    machine.runPasses(1);
    EXPECT_THAT(machine.listed(), ElementsAre(systemFolder("B"))) << key;
    EXPECT_THAT(recorder.take(),
                ElementsAre("SDSystemDidDissappear disk0s2 A", "SDWirestartVolumeDidDissappear disk0s2 A"));
    machine.set("Disks", "disk0s2", mounted);
    machine.runPasses(1);
    EXPECT_THAT(machine.listed(), ElementsAre(systemFolder("B"))) << "searched in this pass, delivered in the next";
    machine.runPasses(1);
    EXPECT_THAT(machine.listed(), ElementsAre(systemFolder("B"), systemFolder("A"))) << key;
    EXPECT_THAT(recorder.take(), ElementsAre("SDBusySearching", "SDBusySearching", "SDSystemDidAppear disk0s2 A",
                                             "SDSystemVolumeDidAppear disk0s2 A"));
  }
  machine.describe(*writePropertyList(keys({{"Disks", keys({{"disk0s2", mounted}})}})));
  machine.runPasses(1);
  EXPECT_THAT(machine.listed(), ElementsAre(systemFolder("A")));
  EXPECT_THAT(recorder.take(),
              ElementsAre("SDSystemDidDissappear disk1s2 B", "SDWirestartVolumeDidDissappear disk1s2 B"));
}

TEST(Controller, HoldsOneSystemOfAVersionOnADisk) {
  StartupMachine machine;
  machine.addVolume("disk0s2", "A");
  machine.addVolume("disk1s2", "B");
  auto& controller = machine.controller();
  NotificationRecorder recorder(machine.notifications);
  const auto found = [&](const char* disk, const char* path, std::int64_t version) {
    const auto system = machine.volume(disk);
    system->setObject(path, recordkey::systemFolderPath);
    system->setObject(version, recordkey::systemVersionMajor);
    controller.foundSystemOnVolume(system);
  };
  const auto count = [&] { return controller.systems().size(); };
  found("disk0s2", "/first", 10);
  found("disk1s2", "/other", 10);
  found("disk0s2", "/second", 10);
  EXPECT_THAT(machine.listed(), ElementsAre("/other", "/second")) << "the later one, as the latest";
  EXPECT_EQ(recorder.take().size(), 6U) << "no disappearance is announced";
  // The records of a disk share what is known of it, so the earlier one is of the new version, too.
  found("disk0s2", "/third", 95);
  EXPECT_EQ(count(), 2U);
  machine.describe(*writePropertyList(Keys()));
  machine.runPasses(1);
  EXPECT_EQ(count(), 0U);
}

TEST(Controller, ExcludesSystemsThatThisMachineCannotUse) {
  const std::string risc("X\0HalbRISC\0", 11);
  const std::string other("X\0Halb\0", 7);
  const std::tuple<const char*, std::string, int, std::int64_t, const char*, bool> cases[] = {
      {"Corvane2,1", risc, 0, 9, "/Volumes/V", true},
      {"Corvane1,1", risc, 0, 9, "/Volumes/V", false},
      {"", other, 0, 9, "/Volumes/V", false},
      {"", other, 0, 10, "/Volumes/V", true},
      {"", risc, 1, 10, "/", false},
      {"", risc, 1, 10, "/Volumes/V", true},
      {"", risc, 0, 10, "/", true},
  };
  for (const auto& [model, compatible, networkStart, version, mountPoint, listed] : cases) {
    StartupMachine machine;
    machine.set("Kernel", "Model", model);
    machine.set("Kernel", "Network Start", networkStart);
    machine.haveDeviceTree(compatible);
    machine.addVolume("disk0s2", "V", keys({{"Mount Point", mountPoint}}));
    machine.controller();
    machine.debug();
    const auto system = machine.volume("disk0s2");
    system->setObject("/folder", recordkey::systemFolderPath);
    system->setObject(version, recordkey::systemVersionMajor);
    machine.controller().foundSystemOnVolume(system);
    EXPECT_EQ(machine.listed().size(), listed ? 1U : 0U) << model << networkStart << version;
    if (listed) continue;
    EXPECT_EQ(machine.systemLog().back(), version == 9 ? "Lumara 9 System Folder excluded: /folder"
                                                       : "Excluding systems on root volume when Wirestarted.");
  }
}

TEST(Controller, SearchesTheVolumesOfCachedPaths) {
  StartupMachine machine;
  machine.addLumaraX("disk0s2", "A");
  auto& controller = machine.controller();
  const auto cache = controller.foundSystemPathsForCache();
  NotificationRecorder recorder(machine.notifications);
  controller.searchSystemWithCache({"/Volumes/Missing", cache.front()});
  EXPECT_THAT(recorder.take(), ElementsAre("SDBusySearching"));
  machine.runPasses(1);
  EXPECT_THAT(machine.listed(), ElementsAre(cache.front()));
  EXPECT_THAT(recorder.take(),
              ElementsAre("SDBusySearching", "SDSystemDidAppear disk0s2 A", "SDSystemVolumeDidAppear disk0s2 A"));
}

TEST(Controller, HearsNothingMoreOnceItIsGoneOrUnregistered) {
  StartupMachine machine;
  NotificationRecorder recorder(machine.notifications);
  {
    SDController controller(machine.environment());
    controller.setSearchPaused(true);
    recorder.take();
    controller.killDACallbacks();
    machine.addLumaraX("disk0s2", "A");
    machine.runPasses(2);
    EXPECT_THAT(recorder.take(), IsEmpty());
    controller.startFindingEvents();
    EXPECT_EQ(controller.systems().size(), 1U);
    controller.searchSystemWithCache({"/Volumes/A"});
    recorder.take();
  }
  machine.addLumaraX("disk1s2", "B");
  machine.runPasses(2);
  EXPECT_THAT(recorder.take(), IsEmpty());
}

#ifdef NDEBUG
constexpr int volumes = 10'000;
constexpr double mostSeconds = 0.5;
#else
constexpr int volumes = 1'000;
constexpr double mostSeconds = 2;  // checked, and perhaps sanitized
#endif

/// Processor time: other work on the machine does not count, nor does the wait of a controller's creation.
double secondsOf(const std::function<void()>& work) {
  const auto start = std::clock();
  work();
  return static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC;
}

TEST(Controller, ListsAndDropsThousandsOfVolumesAtOnce) {
  // Thousands of folders are made soonest in memory.
  if (std::filesystem::is_directory("/dev/shm")) setenv("TMPDIR", "/dev/shm", 1);
  StartupMachine machine;
  Keys disks;
  for (int number = 0; number < volumes; ++number) {
    const auto mountPoint = "/Volumes/V" + std::to_string(number);
    disks.set("disk" + std::to_string(number) + "s2", keys({{"Mount Point", mountPoint}}));
    machine.installLumaraX(mountPoint);
  }
  machine.describe(*writePropertyList(keys({{"Disks", disks}})));
  machine.environment();
  EXPECT_LT(secondsOf([&] { EXPECT_EQ(machine.listed().size(), volumes); }), mostSeconds);
  machine.describe(*writePropertyList(Keys()));
  EXPECT_LT(secondsOf([&] { machine.runPasses(1); }), mostSeconds);
  EXPECT_TRUE(machine.listed().empty());
}

}  // namespace
}  // namespace tavisk
