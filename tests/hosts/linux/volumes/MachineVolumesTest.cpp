// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/disks/DiskTree.h"
#include "hosts/linux/volumes/MachineVolumes.h"
#include "hosts/linux/volumes/VolumeOpener.h"

namespace tavisk {
namespace {

using testing::ElementsAre, testing::HasSubstr;

/// A server with a disk of its own, a stick, and volumes on top of partitions.
class SystemTree : public DiskTree {
 public:
  SystemTree() {
    addDisk("sda", "8:0", 65536);
    know("8:0", "E:ID_PART_TABLE_TYPE=gpt\n");
    addDisk("sdb", "8:16", 8192, usb);
    setSubsystem("/devices/pci0000:00/0000:00:14.0/usb1/1-2", "usb");
  }
  void addVolume(int partition, const std::string& type, const std::string& usage, const std::string& more = "") {
    add("sda", partition, sata, "8:" + std::to_string(partition), type, usage, more);
  }
  void addOnStick(int partition) {
    add("sdb", partition, usb, "8:" + std::to_string(16 + partition), "vfat", "filesystem", "");
  }
  void addMapping(int number, const std::string& name, const std::string& uuid, const std::string& beneath) {
    const auto device = "dm-" + std::to_string(number);
    const auto path = std::string("/sys/devices/virtual/block/") + device;
    addDisk(device, "253:" + std::to_string(number), 2048, "/devices/virtual");
    know("253:" + std::to_string(number), "E:ID_FS_TYPE=ext4\nE:ID_FS_USAGE=filesystem\n");
    write(path + "/dm/name", name + "\n");
    write(path + "/dm/uuid", uuid + "\n");
    link(path + "/slaves/" + beneath, "x");
    link("/sys/class/block/" + beneath + "/holders/" + device, "x");
  }
  MountTable mounts() const { return *MountTable::read(root); }

 private:
  void add(const std::string& disk, int partition, const std::string& carrier, const std::string& number,
           const std::string& type, const std::string& usage, const std::string& more) {
    addPartition(disk, partition, number, static_cast<std::uint64_t>(partition) * 2048, 2048, carrier);
    know(number, "E:ID_FS_TYPE=" + type + "\nE:ID_FS_USAGE=" + usage + "\n" + more);
  }
};

/// Each as "NAME DISK TYPE PARTUUID NODES".
std::vector<std::string> linesOf(const MachineVolumes& found) {
  std::vector<std::string> lines;
  for (const auto& volume : found.volumes) {
    auto line = volume.device.name.text + " " + volume.disk.text + " " + volume.facts.type.value_or("?");
    if (volume.partition) line += " " + volume.partition->uuid + " " + volume.partition->name;
    for (const auto& node : volume.mappedNodes) line += " " + node;
    lines.push_back(line);
  }
  return lines;
}

TEST(MachineVolumes, AreThoseOfItsOwnDisksAndWhatIsMountedOfOthers) {
  SystemTree tree;
  tree.addVolume(1, "vfat", "filesystem",
                 "E:ID_PART_ENTRY_NUMBER=1\nE:ID_PART_ENTRY_UUID=aa01\nE:ID_PART_ENTRY_NAME=EFI\\x20System\n");
  tree.addVolume(2, "btrfs", "filesystem", "E:ID_PART_ENTRY_NUMBER=2\nE:ID_PART_ENTRY_UUID=aa02\n");
  tree.addVolume(3, "crypto_LUKS", "crypto");
  tree.addVolume(4, "crypto_LUKS", "crypto");
  tree.addVolume(5, "LVM2_member", "raid");
  tree.addVolume(6, "swap", "other");
  tree.addMapping(0, "luks-aa04", "CRYPT-LUKS2-aa04", "sda4");
  tree.addMapping(1, "vg--a-ro--ot-real", "LVM-x-real", "sda5");
  tree.addMapping(2, "vg--a-ro--ot", "LVM-x", "dm-1");
  tree.addOnStick(1);
  tree.addOnStick(2);
  tree.mount("8:18", "/dev/sdb2", "/media/stick", "vfat");
  tree.addMbr("sdc", 8192, '\x83');
  tree.addDisk("sdc", "8:32", 8192);
  tree.addPartition("sdc", 1, "8:33", 2048, 2048);
  tree.know("8:33", "E:ID_FS_TYPE=xfs\nE:ID_FS_USAGE=filesystem\n");
  tree.addImage("sda", 0);
  tree.addImage("sdb", 0);
  LinuxDisks disks(tree.machine);
  const auto found = machineVolumes(disks, tree.mounts());
  EXPECT_THAT(linesOf(*found),
              ElementsAre("dm-0 sda ext4 /dev/mapper/luks-aa04 /dev/disk/by-id/dm-name-luks-aa04 "
                          "/dev/disk/by-id/dm-uuid-CRYPT-LUKS2-aa04",
                          "dm-2 sda ext4 /dev/mapper/vg--a-ro--ot /dev/disk/by-id/dm-name-vg--a-ro--ot "
                          "/dev/disk/by-id/dm-uuid-LVM-x /dev/vg-a/ro-ot",
                          "sda1 sda vfat aa01 EFI System", "sda2 sda btrfs aa02 ", "sdb2 sdb vfat",
                          "sdc1 sdc xfs 11223344-01 "));
  EXPECT_THAT(found->unseen, ElementsAre(Failure{"read", "sda3", "it is encrypted and locked"}));
  std::string others;
  for (const auto& [names, isUnseen] : found->others) others += names.device.name.text + (isUnseen ? "? " : " ");
  EXPECT_EQ(others, "sda sda3? sda6 sdb sdb1 sdc ");
}

/// A volume that is mounted where the tree has a folder.
class MountedTree : public SystemTree {
 public:
  MountedTree() {
    addVolume(1, "ext4", "filesystem", "E:ID_PART_ENTRY_NUMBER=1\n");
    mount("8:1", "/dev/sda1", "/srv", "ext4");
    write("/srv/etc/issue", "inside\n");
    link("/srv/out", "/../../../etc/../etc/issue");
  }
  Volume volume() {
    LinuxDisks disks(machine);
    return machineVolumes(disks, mounts())->volumes.at(0);
  }
};

void readsThrough(const SystemRoot& files) {
  EXPECT_EQ(files.read("/etc/issue", 10).valueOr("unread"), "inside\n");
  EXPECT_EQ(files.read("/out", 10).valueOr("unread"), "inside\n");
  EXPECT_EQ(files.readLink("/out").valueOr("unread"), "/../../../etc/../etc/issue");
  EXPECT_THAT(files.list("/").valueOr({}), ElementsAre("etc", "out"));
  EXPECT_TRUE(isAbsent(files.read("/etc/none", 10).failure()));
}

TEST(VolumeOpener, ReadsAMountedVolumeWithOrWithoutTheRightToCopyItsMount) {
  MountedTree tree;
  VolumeOpener opener(tree.at("/"), tree.mounts());
  readsThrough(*opener.open(tree.volume()));
  const auto volume = tree.volume();
  const AsMember member(tree);
  VolumeOpener other(tree.at("/"), tree.mounts());
  const auto files = other.open(volume);
  ASSERT_TRUE(files) << describe(files.failure());
  EXPECT_THAT(files->prefix(), HasSubstr("/srv"));
  readsThrough(*files);
}

TEST(VolumeOpener, ReadsNothingElseInAVolumesPlace) {
  MountedTree tree;
  const auto volume = tree.volume();
  VolumeOpener late(tree.at("/"), tree.mounts());
  tree.mount("8:2", "/dev/sda2", "/srv", "ext4");
  EXPECT_THAT(describe(late.open(volume).failure()), HasSubstr("something else is mounted there"));
  VolumeOpener unmounted(tree.at("/"), MountTable(""));
  EXPECT_FALSE(unmounted.open(volume));
}

}  // namespace
}  // namespace tavisk
