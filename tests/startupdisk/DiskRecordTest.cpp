// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <thread>

#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

TEST(DiskRecord, WithoutADiskAnswersNothing) {
  StartupMachine machine;
  SDDisk record(machine.environment().diskServices(), std::nullopt);
  for (const auto& text : {record.diskIdentifier(), record.protocol(), record.mountPoint(), record.description(),
                           *record.filesystemType(), *record.deviceTreePath(), *record.volumeName()})
    EXPECT_EQ(text, "");
  EXPECT_FALSE(record.isInternal() || record.isCDROM() || record.isDVDROM() || record.isOptical());
  EXPECT_FALSE(record.contextObject());
  EXPECT_FALSE(SDDisk::wholeDiskFromSDDisk(record));
  record.setObject("any", recordkey::wirestart);
  EXPECT_EQ(SDDisk(machine.environment().diskServices(), std::nullopt).textForKey(recordkey::wirestart), "any");
}

TEST(DiskRecord, DescribesItselfByWhatTheHostKnows) {
  StartupMachine machine;
  machine.addVolume("disk0s3", "Data");
  machine.set("Disks", "disk1", Keys());
  const std::pair<const char*, const char*> descriptions[] = {
      {"disk0s3", "disk0s3 Data"}, {"disk1", "disk1 (null)"}, {"disk9", "(null) (null)"}};
  for (const auto& [disk, description] : descriptions) EXPECT_EQ(machine.volume(disk)->description(), description);
}

TEST(DiskRecord, ADiskHasOneContextForAllItsRecords) {
  StartupMachine machine;
  machine.addVolume("disk0s3", "Data");
  const auto record = machine.volume("disk0s3");
  EXPECT_FALSE(record->contextObject());
  EXPECT_FALSE(record->objectForKey("Key"));
  record->removeObjectForKey("Key");
  record->setVolumeName("Other");
  const auto second = SDDisk::diskFromDisk(*record);
  EXPECT_EQ(second->volumeName(), "Other");
  second->setObject(std::int64_t{10}, "Key");
  EXPECT_EQ(machine.volume("disk0s3")->integerForKey("Key"), 10);
  EXPECT_EQ(record->contextObject()->size(), 2U);
  record->removeObjectForKey(recordkey::volumeName);
  EXPECT_EQ(second->volumeName(), "Data");
  EXPECT_FALSE(machine.volume("disk0")->contextObject());
}

TEST(DiskRecord, ContextsAreOfAllThreads) {
  constexpr int times = 500;
  StartupMachine machine;
  auto& environment = machine.environment();
  const auto learn = [&](const std::string& disk) {
    for (int time = 0; time < times; ++time)
      SDDisk(environment.diskServices(), DiskName{disk + std::to_string(time)})
          .setObject(std::int64_t{time}, recordkey::systemVersionMajor);
  };
  std::thread other(learn, "disk1s");
  learn("disk0s");
  other.join();
  for (const char* disk : {"disk0s", "disk1s"}) {
    const auto last = machine.volume(disk + std::to_string(times - 1));
    EXPECT_EQ(last->integerForKey(recordkey::systemVersionMajor), times - 1) << disk;
  }
}

TEST(DiskRecord, IsMadeFromAnyPathOfItsVolume) {
  StartupMachine machine;
  machine.addVolume("disk0s2", "Main", keys({{"Mount Point", "/"}}));
  machine.addVolume("disk1s2", "Data");
  machine.addVolume("disk2s2", "Data2");
  machine.writeFile("/Volumes/Data/folder/file", "");
  const std::pair<const char*, const char*> cases[] = {
      {"/Volumes/Data/folder/file", "disk1s2"},
      {"/Volumes/Data/", "disk1s2"},
      {"/Volumes/Data2", "disk2s2"},
      {"/Volumes/Data/../Data2", "disk2s2"},
      {"/Volumes", "disk0s2"},
      {"/", "disk0s2"},
      {"/Volumes/Missing", "none"},
      {"Volumes/Data", "none"},
  };
  for (const auto& [path, disk] : cases) {
    const auto record = SDDisk::initWithDADiskFromPath(path, machine.environment().diskServices());
    EXPECT_EQ(record ? record->diskIdentifier() : "none", disk) << path;
  }
}

TEST(DiskRecord, FindsItsWholeDisk) {
  StartupMachine machine;
  machine.set("Disks", "disk7", keys({{"Whole Disk", "disk0"}}));
  for (const char* name : {"disk0s3", "sda2", "disk1", "disk2s"}) machine.set("Disks", name, Keys());
  const std::pair<const char*, const char*> cases[] = {
      {"disk0s3", "disk0"}, {"disk1", "disk1"}, {"disk2s", "disk2s"}, {"sda2", "sda2"}, {"disk7", "disk0"}};
  for (const auto& [disk, whole] : cases) {
    const auto record = machine.volume(disk);
    record->setObject("here", "Key");
    const auto wholeRecord = SDDisk::wholeDiskFromSDDisk(*record);
    EXPECT_EQ(wholeRecord->diskIdentifier(), whole);
    EXPECT_EQ(wholeRecord->has("Key"), std::string(disk) == whole);
    EXPECT_EQ(record->diskIdentifier(), disk);
  }
}

TEST(MessageFormat, PutsValuesInTheirPlaces) {
  const std::optional<std::string> absent;
  const std::pair<std::string, const char*> cases[] = {
      {formatMessage("plain", {}), "plain"},
      {formatMessage("%@ and %@", {"disk0s2", absent}), "disk0s2 and (null)"},
      {formatMessage("type %@", {}), "type (null)"},
      {formatMessage("%s: %@ isCDROM: %d isDVDROM: %d", {"-[X y:]", "disk0 A", true, false}),
       "-[X y:]: disk0 A isCDROM: 1 isDVDROM: 0"},
      {formatMessage("%@:%ld", {"en", std::int64_t{-7}}), "en:-7"},
      {formatMessage("%s failed %08x", {"f", std::uint32_t{0xE00002F0U}}), "f failed e00002f0"},
      {formatMessage("%08x", {2}), "00000002"},
      {formatMessage("%.0f seconds\n", {4.5}), "4 seconds\n"},
      {formatMessage("%.0f", {1e300}).substr(0, 5), "10000"},
      {formatMessage("%@", {std::variant<std::string, std::int64_t>(std::int64_t{95})}), "95"},
      {formatMessage("%@ %@", {"100%@", "b"}), "100%@ b"},
  };
  for (const auto& [message, expected] : cases) EXPECT_EQ(message, expected);
}

}  // namespace
}  // namespace tavisk
