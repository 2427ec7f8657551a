// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/BlockProbe.h"
#include "hosts/linux/disks/DiskTree.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

TEST(BlockDevices, TellsDisksAndPartitions) {
  DiskTree tree;
  tree.addDisk("sda", "8:0", 4096);
  tree.addPartition("sda", 2, "8:2", 2048, 1000);
  tree.write("/sys" + std::string(DiskTree::sata) + "/block/sda/queue/logical_block_size", "4096\n");
  const BlockDevices devices(tree.root);
  EXPECT_THAT(*devices.list(), ElementsAre(DiskName{"sda"}, DiskName{"sda2"}));
  const auto partition = *devices.find({"sda2"});
  ASSERT_TRUE(partition);
  EXPECT_EQ(partition->number, (DeviceNumber{8, 2}));
  EXPECT_EQ(partition->path, std::string(DiskTree::sata) + "/block/sda/sda2");
  EXPECT_EQ(partition->node, "/dev/sda2");
  EXPECT_EQ(partition->disk.text, "sda");
  EXPECT_EQ(partition->partition, 2);
  EXPECT_EQ(partition->start, 2048U);
  EXPECT_EQ(partition->size, 1000U);
  EXPECT_EQ((*devices.withNumber({8, 2}))->name.text, "sda2");
  EXPECT_EQ(*devices.logicalBlockSize({"sda"}), 4096U);
  for (const char* name : {"", ".", "..", "sdb", "sda/sda2", "../block/sda"})
    EXPECT_FALSE(*devices.find({name})) << name;
  EXPECT_FALSE(*devices.withNumber({8, 9}));
}

TEST(BlockDevices, FindsTheDiskBeneathAMapping) {
  DiskTree tree;
  for (const char* disk : {"sda", "sdb"}) tree.addDisk(disk, disk == std::string("sda") ? "8:0" : "8:16", 4096);
  tree.addPartition("sdb", 1, "8:17", 2048, 1000);
  tree.addDisk("md0", "9:0", 900, "/devices/virtual");
  tree.addPartition("md0", 1, "259:0", 8, 800, "/devices/virtual");
  tree.addDisk("dm-0", "253:0", 700, "/devices/virtual");
  tree.link("/sys/devices/virtual/block/md0/slaves/sdb1", "../../..");
  tree.link("/sys/devices/virtual/block/dm-0/slaves/md01", "../../..");
  tree.link("/dev/mapper/system-root", "../dm-0");
  tree.write("/dev/dm-0", "");
  const BlockDevices devices(tree.root);
  for (const auto& [name, disk] : {std::pair("sda", "sda"), std::pair("sdb1", "sdb"), std::pair("md0", "sdb"),
                                   std::pair("md01", "sdb"), std::pair("dm-0", "sdb"), std::pair("none", "none")})
    EXPECT_EQ(devices.wholeDisk({name})->text, disk) << name;
  EXPECT_EQ((*devices.withNode("/dev/mapper/system-root"))->name.text, "dm-0");
  EXPECT_FALSE(*devices.withNode("/dev/mapper/other"));
}

struct Connection {
  const char* carrier;
  const char* subsystemAt;
  const char* subsystem;
  const char* removableAt;
  const char* removable;
  const char* transport;
  bool internal;
};

TEST(BlockDevices, TellsHowADiskIsConnected) {
  constexpr const char* usbDevice = "/devices/pci0000:00/0000:00:14.0/usb1/1-2";
  constexpr const char* nvme = "/devices/pci0000:00/0000:00:06.0/0000:06:00.0/nvme/nvme0";
  const Connection connections[] = {
      {DiskTree::sata, DiskTree::sata, "scsi", "", "", "SATA", true},
      {DiskTree::usb, usbDevice, "usb", "", "", "USB", false},
      {DiskTree::usb, usbDevice, "usb", usbDevice, "fixed", "USB", true},
      {DiskTree::usb, usbDevice, "usb", usbDevice, "unknown", "USB", false},
      {nvme, nvme, "nvme", "", "", "NVMe", true},
      {nvme, nvme, "nvme", "/devices/pci0000:00/0000:00:06.0", "removable", "NVMe", false},
      {"/devices/pci0000:00/0000:00:02.0/virtio1", "/devices/pci0000:00/0000:00:02.0/virtio1", "virtio", "", "",
       "Virtio", true},
      {"/devices/platform/host8/session1/target8:0:0/8:0:0:1", "", "", "", "", "iSCSI", false},
      {"/devices/pci0000:00/0000:01:00.0/host0/port-0:0/end_device-0:0/target0:0:0/0:0:0:0", "", "", "", "", "SAS",
       true},
      {"/devices/pci0000:00/0000:01:00.0/host0/rport-0:0-1/target0:0:0/0:0:0:0", "", "", "", "", "Fibre Channel", true},
      {"/devices/virtual", "", "", "", "", "", true},
  };
  for (const auto& connection : connections) {
    DiskTree tree;
    tree.addDisk("sdx", "8:32", 64, connection.carrier);
    if (*connection.subsystem != 0) tree.setSubsystem(connection.subsystemAt, connection.subsystem);
    if (*connection.removable != 0)
      tree.write(std::string("/sys") + connection.removableAt + "/removable", connection.removable + std::string("\n"));
    const BlockDevices devices(tree.root);
    EXPECT_EQ(*devices.transportOf({"sdx"}), connection.transport) << connection.carrier;
    EXPECT_EQ(*devices.isInternal({"sdx"}), connection.internal) << connection.carrier << connection.removable;
  }
}

TEST(BlockProbe, TellsWhatIsEmptyFromWhatCannotBeRead) {
  DiskTree tree;
  tree.addImage("empty", 8);
  tree.write("/dev/folder/file", "");
  EXPECT_EQ(probeVolume(tree.root, "/dev/empty")->type, std::nullopt);
  EXPECT_EQ(probePartitionTable(tree.root, "/dev/empty")->type, "");
  for (const char* node : {"/dev/none", "/dev/folder"}) EXPECT_FALSE(probeVolume(tree.root, node)) << node;
}

}  // namespace
}  // namespace tavisk
