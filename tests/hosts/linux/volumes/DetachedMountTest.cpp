// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/statvfs.h>

#include "LoopDevice.h"
#include "OwnMounts.h"
#include "hosts/linux/disks/DiskTree.h"
#include "hosts/linux/volumes/DetachedMount.h"
#include "hosts/linux/volumes/VolumeOpener.h"

namespace tavisk {
namespace {

/// Why real volumes cannot be made here; empty: they can.
std::string withRealVolumes(const std::function<void(const TemporaryFolder&)>& work) {
  if (::geteuid() != 0) return "only root makes loop devices";
  if (!runTool("command -v mkfs.ext4")) return "mkfs.ext4 is missing";
  if (LoopDevice::nextName().empty()) return "no loop devices here";
  const TemporaryFolder folder;
  return withOwnMounts([&] { work(folder); }) ? "" : "no mounts of one's own here";
}

class Image {
 public:
  Image(const TemporaryFolder& folder, const std::string& name, const std::string& maker)
      : _path(folder.write(name, "")), _point(folder.path() / ("at " + name)) {
    std::filesystem::resize_file(_path, std::uintmax_t{16} << 20U);
    std::filesystem::create_directories(_point);
    EXPECT_TRUE(runTool(maker + " " + _path.string()));
  }
  const std::filesystem::path& path() const { return _path; }
  const std::filesystem::path& point() const { return _point; }
  bool mount(const LoopDevice& device, const char* type) const {
    return ::mount(device.node().c_str(), _point.c_str(), type, 0, nullptr) == 0;
  }
  void unmount() const { EXPECT_EQ(::umount(_point.c_str()), 0); }

 private:
  std::filesystem::path _path;
  std::filesystem::path _point;
};

Volume volumeOf(const LoopDevice& device, const char* type) {
  Volume volume;
  volume.device = BlockDevices(SystemRoot("/")).find({device.name()})->value();
  volume.facts.type = type;
  return volume;
}

std::string mountInfo() {
  return contentsOf(MountTable::file);
}

/// What is on the disk while a system runs, or has lost its power.
void takeAtWork(const Image& image, const char* type) {
  const LoopDevice device(image.path());
  ASSERT_TRUE(image.mount(device, type));
  std::ofstream(image.point() / "file") << "inside";
  ::sync();
  const auto bytes = contentsOf(image.path());
  image.unmount();
  std::ofstream(image.path(), std::ios::binary) << bytes;
}

/// Whether what is on the volume can be neither written nor started, and is no device.
bool isForLookingAlone(const SystemRoot& files) {
  constexpr unsigned long all = ST_RDONLY | ST_NOSUID | ST_NODEV | ST_NOEXEC;
  struct statvfs status {};
  const auto top = files.open("/", O_RDONLY | O_DIRECTORY);
  return top && ::fstatvfs(top->number(), &status) == 0 && (status.f_flag & all) == all;
}

TEST(DetachedMount, LeavesNoTraceOfTheLook) {
  const auto obstacle = withRealVolumes([](const TemporaryFolder& folder) {
    for (const auto& [type, maker] :
         {std::pair("ext4", "mkfs.ext4 -q"), std::pair("ext4", "mkfs.ext4 -q -O ^has_journal"),
          std::pair("ext3", "mkfs.ext3 -q"), std::pair("ext2", "mkfs.ext2 -q")}) {
      const Image image(folder, "image", maker);
      takeAtWork(image, type);
      const auto before = contentsOf(image.path());
      const LoopDevice device(image.path());
      const auto mounts = mountInfo();
      VolumeOpener opener("/", *MountTable::read(SystemRoot("/")));
      {
        const auto files = opener.open(volumeOf(device, type));
        ASSERT_TRUE(files) << describe(files.failure());
        EXPECT_EQ(opener.open(volumeOf(device, type))->prefix(), files->prefix());
        EXPECT_FALSE(files->write("/new", ""));
        EXPECT_TRUE(isForLookingAlone(*files));
        EXPECT_EQ(mountInfo(), mounts);
        EXPECT_FALSE(image.mount(device, type)) << "for writing, while it is looked at";
        opener.close();
        EXPECT_FALSE(opener.open(volumeOf(device, type)));
        EXPECT_FALSE(files->read("/file", 10));
      }
      ::sync();
      EXPECT_TRUE(contentsOf(image.path()) == before) << maker;
      EXPECT_TRUE(image.mount(device, type)) << "it is no longer looked at";
      image.unmount();
    }
  });
  if (!obstacle.empty()) GTEST_SKIP() << obstacle;
}

TEST(DetachedMount, SeesWhatLiesBeneathAnotherMount) {
  const auto obstacle = withRealVolumes([](const TemporaryFolder& folder) {
    const Image image(folder, "image", "mkfs.ext4 -q");
    const LoopDevice device(image.path());
    ASSERT_TRUE(image.mount(device, "ext4"));
    const auto boot = image.point() / "boot";
    std::filesystem::create_directory(boot);
    std::ofstream(boot / "beneath") << "inside";
    ASSERT_TRUE(mountMemory(boot, "64k"));
    std::ofstream(boot / "above") << "other";
    VolumeOpener opener("/", *MountTable::read(SystemRoot("/")));
    const auto files = opener.open(volumeOf(device, "ext4"));
    ASSERT_TRUE(files) << describe(files.failure());
    EXPECT_EQ(files->read("/boot/beneath", 10).valueOr("unread"), "inside");
    EXPECT_FALSE(files->isThere("/boot/above").valueOr(true));
    EXPECT_FALSE(files->write("/new", ""));
    EXPECT_TRUE(isForLookingAlone(*files)) << "a copy of the mount";
    EXPECT_EQ(mountDetached(device.node(), "ext4").failure().code, std::errc::device_or_resource_busy);
    EXPECT_FALSE(mountDetached(device.node(), "ntfs3"));
  });
  if (!obstacle.empty()) GTEST_SKIP() << obstacle;
}

}  // namespace
}  // namespace tavisk
