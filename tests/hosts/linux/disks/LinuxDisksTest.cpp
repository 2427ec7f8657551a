// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <map>

#include "LoopDevice.h"
#include "OwnMounts.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/disks/DiskTree.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/shared/DiskCallbacks.h"
#include "platform/DiskEventsContract.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::Each, testing::IsEmpty, testing::Not;

/// Disks of this machine that are images, with mounts that nobody else sees.
class RealDisks {
 public:
  template <typename Work>
  static std::string run(const Work& work) {
    if (::geteuid() != 0) return "only root makes loop devices";
    if (!runTool("command -v mkfs.ext4 && command -v e2label")) return "mkfs.ext4 is missing";
    if (LoopDevice::nextName().empty()) return "no loop devices here";
    const bool allowed = withOwnMounts([&] {
      RealDisks machine;
      work(machine);
    });
    return allowed ? "" : "no mounts of one's own here";
  }

  RealDisks() = default;
  ~RealDisks() {
    for (const auto& [name, plugged] : _disks) ::umount2(pointOf({name}).c_str(), MNT_DETACH);
  }
  RealDisks(const RealDisks&) = delete;
  RealDisks& operator=(const RealDisks&) = delete;

  DiskEventSession& service() { return _host.diskEvents(); }
  RunLoop& runLoop() { return _runLoop; }
  DiskName plug(const std::string& label) {
    const auto image = newImage();
    EXPECT_TRUE(runTool("mkfs.ext4 -q -L " + label + " " + image));
    waitUntilGone({LoopDevice::nextName()});
    LoopDevice device(image);
    DiskName disk{device.name()};
    _disks.insert_or_assign(disk.text, Plugged{std::move(device), image});
    return disk;
  }
  std::string mount(const DiskName& disk) {
    auto point = pointOf(disk);
    std::filesystem::create_directories(point);
    EXPECT_EQ(::mount(("/dev/" + disk.text).c_str(), point.c_str(), "ext4", 0, nullptr), 0);
    return point;
  }
  void unmount(const DiskName& disk) { EXPECT_EQ(::umount((_folder.path() / ("mounted " + disk.text)).c_str()), 0); }
  void rename(const DiskName& disk, const std::string& label) {
    EXPECT_TRUE(runTool("e2label /dev/" + disk.text + " " + label));
    // As the device manager does for one who has written to a device.
    std::ofstream("/sys/class/block/" + disk.text + "/uevent") << "change";
  }
  void grow(const DiskName& disk) {
    const auto& plugged = _disks.at(disk.text);
    std::filesystem::resize_file(plugged.image, 2 * imageSize);
    EXPECT_TRUE(plugged.device.resize());
  }
  void pull(const DiskName& disk) { _disks.erase(disk.text); }

 private:
  static constexpr std::uintmax_t imageSize = 1U << 20U;
  struct Plugged {
    LoopDevice device;
    std::string image;
  };
  std::string pointOf(const DiskName& disk) const { return _folder.path() / ("mounted " + disk.text); }
  /// A device that was another image's a moment ago would not appear, but change.
  void waitUntilGone(const DiskName& disk) {
    const auto deadline = RunLoop::Clock::now() + std::chrono::seconds(2);
    static_cast<void>(_runLoop.runUntil(deadline, [&] { return service().description(disk) == nullptr; }));
  }
  std::string newImage() {
    const auto image = _folder.write("image" + std::to_string(++_last), "");
    std::filesystem::resize_file(image, imageSize);
    return image;
  }

  TemporaryFolder _folder;
  std::map<std::string, Plugged> _disks;
  int _last = 0;
  EffectSink _effects;
  RunLoop _runLoop;
  LinuxHost _host{_effects, _runLoop};
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, DiskEventsContract, RealDisks);

/// A server's disks in files: a SATA disk with partitions, a stick, a disc.
class ServerDisks : public DiskTree {
 public:
  static constexpr const char* drive = "/devices/pci0000:00/0000:00:1f.2/ata2/host1/target1:0:0/1:0:0:0";

  ServerDisks() {
    addDisk("sda", "8:0", 8192);
    addPartition("sda", 1, "8:1", 2048, 2048);
    addPartition("sda", 2, "8:2", 4096, 2048);
    addDisk("sdb", "8:16", 64, usb);
    setSubsystem("/devices/pci0000:00/0000:00:14.0/usb1/1-2", "usb");
    addDisk("sr0", "11:0", 2048, drive);
    addDisk("loop0", "7:0", 0, "/devices/virtual");
    mount("8:2", "/dev/sda2", "/", "ext4");
  }
  std::shared_ptr<const DiskDescription> describe(const std::string& disk) {
    return host().diskEvents().description({disk});
  }
  void whileUnreadable(const std::string& path, const std::function<void()>& work) {
    const auto kept = path + ".kept";
    std::filesystem::rename(at(path), at(kept));
    makeUnreadable(path);
    work();
    std::filesystem::remove(at(path));
    std::filesystem::rename(at(kept), at(path));
  }
};

TEST(LinuxDisks, DescribesWhatTheDeviceManagerKnows) {
  ServerDisks tree;
  tree.know("8:2",
            "E:ID_FS_TYPE=ext4\nE:ID_FS_USAGE=filesystem\nE:ID_FS_LABEL=Server_Root\n"
            "E:ID_FS_LABEL_ENC=Server\\x20Root\nE:ID_FS_UUID_ENC=0f1e\nE:ID_PART_ENTRY_TYPE=0fc63daf\n"
            "E:ID_PATH=pci-0000:00:1f.2-ata-1\n");
  const auto root = tree.describe("sda2");
  ASSERT_TRUE(root);
  EXPECT_EQ(root->mediaName, "sda2");
  EXPECT_EQ(root->volumeName, "Server Root");
  EXPECT_EQ(root->volumePath, "/");
  EXPECT_EQ(root->volumeKind, "ext4");
  EXPECT_EQ(root->volumeUuid, "0f1e");
  EXPECT_EQ(root->mediaContent, "0fc63daf");
  EXPECT_EQ(root->devicePath, std::string(DiskTree::sata) + "/block/sda/sda2");
  EXPECT_EQ(root->busPath, "pci-0000:00:1f.2-ata-1");
  EXPECT_EQ(root->mediaSize, 2048 * 512);
  EXPECT_TRUE(root->mediaWritable);
  EXPECT_TRUE(root->volumeMountable);
  EXPECT_FALSE(root->volumeNetwork);
  EXPECT_EQ(tree.describe("loop0"), nullptr);
  EXPECT_EQ(tree.host().diskEvents().wholeDisk({"sda2"}).text, "sda");
}

TEST(LinuxDisks, ReadsTheDiskWhereNoDeviceManagerRuns) {
  ServerDisks tree;
  const auto disk = tree.addImage("sda", 8192);
  const auto volume = tree.addImage("sda1", 2048);
  if (!runTool("mkfs.vfat -n BACKUP -i 1A2B3C4D " + volume) || !runTool("sgdisk -n 1:2048:4095 -t 1:ef00 " + disk))
    GTEST_SKIP() << "mkfs.vfat or sgdisk is missing";
  const auto start = tree.describe("sda1");
  ASSERT_TRUE(start);
  EXPECT_EQ(start->volumeName, "BACKUP");
  EXPECT_EQ(start->volumeKind, "msdos");
  EXPECT_EQ(start->volumeUuid, "1A2B-3C4D");
  EXPECT_EQ(start->mediaContent, efiSystemPartitionGuid);
  EXPECT_EQ(start->volumePath, std::nullopt);
  EXPECT_TRUE(start->volumeMountable);
  EXPECT_EQ(tree.describe("sda")->mediaContent, "gpt");
  EXPECT_FALSE(tree.describe("sda")->volumeMountable);
  EXPECT_EQ(tree.host().diskManagement().partitionScheme({"sda1"}), 2);

  // Mounted and not to be read: what the mount table says is left, and the failure is told.
  EXPECT_EQ(tree.describe("sda2")->volumeKind, "ext4");
  EXPECT_THAT(tree.log.effects, AllOf(Not(IsEmpty()), Each(FailedFor("/dev/sda2"))));
}

TEST(LinuxDisks, FindsTheDiskOfAnyPath) {
  ServerDisks tree;
  tree.mount("0:40", "/dev/sda1", "/data", "btrfs");
  tree.mount("0:41", "server:/export", "/net", "nfs4");
  tree.mount("0:42", "overlay", "/over", "overlay");
  tree.mount("0:43", "tmpfs", "/tmp", "tmpfs");
  tree.setMounts(tree.file("/proc/thread-self/mountinfo") +
                 "40 1 0:44 / /upper rw - overlay overlay rw,lowerdir=/net:/,upperdir=/data/up,workdir=/data/w\n"
                 "41 1 0:45 / /loop rw - overlay overlay ro,lowerdir=/loop\n");
  for (const char* folder : {"/upper", "/loop", "/data/up"}) tree.write(folder + std::string("/file"), "");
  auto& session = tree.host().diskEvents();
  const std::pair<const char*, std::optional<DiskName>> expected[] = {{"/", DiskName{"sda2"}},
                                                                      {"/data/up/file", DiskName{"sda1"}},
                                                                      {"/net", DiskName{"server:/export"}},
                                                                      {"/upper/file", DiskName{"sda1"}},
                                                                      {"/loop/file", std::nullopt},
                                                                      {"/over", std::nullopt},
                                                                      {"/tmp", std::nullopt}};
  for (const auto& [path, disk] : expected) EXPECT_EQ(session.diskOfPath(path), disk) << path;
  EXPECT_EQ(tree.describe("sda1")->volumePath, "/data");
  const auto network = tree.describe("server:/export");
  ASSERT_TRUE(network);
  EXPECT_TRUE(network->volumeNetwork);
  EXPECT_EQ(network->volumePath, "/net");
}

TEST(LinuxDisks, NoticesAtAMountWhatCameWithoutAnEvent) {
  ServerDisks tree;
  LinuxDisks disks(tree.machine);
  tree.know("8:1", "E:ID_FS_TYPE=vfat\n");
  ASSERT_TRUE(disks.find({"sda1"}));
  EXPECT_EQ(disks.find({"sda1"})->volumeKind, "msdos");
  EXPECT_FALSE(disks.find({"sdc"}));
  tree.know("8:1", "E:ID_FS_TYPE=ntfs\n");
  tree.addDisk("sdc", "8:32", 64);
  tree.mount("8:1", "/dev/sda1", "/first", "ntfs3");
  tree.mount("8:32", "/dev/sdc", "/second", "ext4");
  disks.renew({});
  EXPECT_EQ(disks.find({"sda1"})->volumeKind, "ntfs");
  EXPECT_EQ(disks.find({"sda1"})->volumePath, "/first");
  ASSERT_TRUE(disks.find({"sdc"}));
  EXPECT_EQ(disks.find({"sdc"})->volumePath, "/second");
}

TEST(LinuxDisks, StayAsTheyWereWhenTheyCannotBeLookedAt) {
  ServerDisks tree;
  tree.know("8:2", "E:ID_FS_TYPE=ext4\nE:ID_FS_USAGE=filesystem\n");
  LinuxDisks disks(tree.machine);
  const auto before = disks.renew({{}, true});
  ASSERT_EQ(disks.find({"sda2"})->volumePath, "/");
  const auto sizeFile = "/sys" + std::string(DiskTree::sata) + "/block/sda/sda2/size";
  const std::string unseen[] = {MountTable::file, "/sys/class/block", sizeFile, "/run/udev/data/b8:2"};
  for (const auto& path : unseen) {
    tree.log.effects.clear();
    LinuxDisks others(tree.machine);
    tree.whileUnreadable(path, [&] {
      others.renew({{}, true});
      others.renew({{}, true});
      EXPECT_THAT(tree.log.effects, testing::ElementsAre(FailedFor("Too many levels")));
      EXPECT_THAT(differences(*before, *disks.renew({{}, true})), IsEmpty()) << path;
    });
    EXPECT_THAT(differences(*before, *others.renew({})), IsEmpty()) << "looked at again: " << path;
  }
}

TEST(LinuxDisks, KeepAVolumeOfWhichOneLookFails) {
  ServerDisks tree;
  tree.mount("0:40", "/dev/sda1", "/data", "btrfs");
  const auto image = tree.addImage("sda2", 2048);
  if (!runTool("mkfs.ext4 -L Main " + image)) GTEST_SKIP() << "mkfs.ext4 is missing";
  LinuxDisks disks(tree.machine);
  const auto before = disks.renew({{}, true});
  const auto device = "/sys" + std::string(DiskTree::sata) + "/block/sda/sda1/uevent";
  for (const auto& path : {std::string("/dev/sda2"), device}) {
    tree.whileUnreadable(path, [&] {
      EXPECT_THAT(differences(*before, *disks.renew({{"sda2"}, false})), IsEmpty()) << path;
    });
  }
}

TEST(LinuxDisks, TellOfAVolumeThatIsUnmountedAndLosesItsNodeAtOnce) {
  ServerDisks tree;
  LinuxDisks disks(tree.machine);
  tree.know("8:1", "E:ID_FS_TYPE=ext4\nE:ID_FS_USAGE=filesystem\n");
  const auto mounts = tree.file(MountTable::file);
  tree.mount("8:1", "/dev/sda1", "/data", "ext4");
  const auto before = disks.renew({{}, true});
  tree.setMounts(mounts);
  std::filesystem::remove(tree.at("/run/udev/data/b8:1"));
  const auto after = disks.renew({{"sda1"}, false});
  DiskCallbacks callbacks;
  std::vector<DiskEvent::Kind> told;
  const auto note = [](const DiskEvent& event, void* context) {
    static_cast<std::vector<DiskEvent::Kind>*>(context)->push_back(event.kind);
  };
  for (const auto kind : {DiskEvent::Kind::appeared, DiskEvent::Kind::descriptionChanged, DiskEvent::Kind::disappeared})
    callbacks.add({note, &told, kind, {true, false}, {DiskKey::volumePath}});
  callbacks.tellDifferences(*before, *after);
  EXPECT_THAT(told, testing::ElementsAre(DiskEvent::Kind::disappeared));
}

TEST(LinuxDisks, AnswerForAPartitionAsForItsDiskAndForADriveWithoutADisc) {
  ServerDisks tree;
  tree.know("8:0", "E:ID_PART_TABLE_TYPE=dos\n");
  tree.know("11:0", "E:ID_CDROM=1\n");
  auto& queries = tree.host().diskManagement();
  EXPECT_TRUE(queries.is(DiskTrait::internal, {"sda2"}));
  EXPECT_EQ(queries.protocolOf({"sda2"}), "SATA");
  EXPECT_EQ(queries.partitionScheme({"sda2"}), 3);
  EXPECT_EQ(tree.describe("sr0"), nullptr);
  EXPECT_TRUE(queries.is(DiskTrait::optical, {"sr0"}));
  EXPECT_NE(queries.opticalBootability({"sr0"}).status, 0);
}

TEST(DeviceEvents, NameTheBlockDevice) {
  using namespace std::string_view_literals;
  const std::pair<std::string_view, std::optional<std::string>> events[] = {
      {"add@/devices/x/block/sdb\0ACTION=add\0DEVPATH=/devices/x/block/sdb\0SUBSYSTEM=block\0MAJOR=8\0"sv, "sdb"},
      {"libudev\0\xfe\xed\xca\xfe\x28\0\0\0(\0\0\0SUBSYSTEM=block\0DEVNAME=/dev/sda1\0DEVPATH=/devices/x/block/sda/sda1"sv,
       "sda1"},
      {"change@/devices/x/net/eth0\0SUBSYSTEM=net\0DEVPATH=/devices/x/net/eth0\0"sv, std::nullopt},
      {"SUBSYSTEM=block\0DEVPATH=/"sv, std::nullopt},
      {"\0\0\0"sv, std::nullopt},
      {""sv, std::nullopt}};
  for (const auto& [event, device] : events) EXPECT_EQ(blockDeviceIn(event), device) << event;
}

}  // namespace
}  // namespace tavisk
