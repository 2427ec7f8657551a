// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <chrono>

#include "hosts/linux/disks/MountTable.h"

namespace tavisk {
namespace {

std::string pointOf(const Mount* mount) {
  return !mount ? "none" : mount->point;
}

TEST(MountTable, ReadsWhatTheKernelWrites) {
  const MountTable table(
      "22 27 0:21 / /proc rw,relatime - proc proc rw\n"
      "27 1 8:2 / / rw,relatime shared:1 master:2 - ext4 /dev/sda2 rw,discard\n"
      "30 27 8:3 /sub /mnt/a\\040b\\134c\\011 rw - vfat /dev/sda3 ro,errors=remount-ro\n"
      "31 27 8:4 / /ro ro,nosuid - ext4 /dev/sda4 rw\n"
      "32 27 0:40 / /nothing rw - tmpfs  rw,size=4k\n"
      "no mount\n"
      "33 27 0:41 / relative rw - tmpfs none rw");
  ASSERT_EQ(table.mounts().size(), 5U);
  const auto& escaped = table.mounts()[2];
  EXPECT_EQ(escaped.point, "/mnt/a b\\c\t");
  EXPECT_EQ(escaped.root, "/sub");
  EXPECT_EQ(escaped.device, (DeviceNumber{8, 3}));
  EXPECT_EQ(escaped.type, "vfat");
  EXPECT_EQ(escaped.source, "/dev/sda3");
  EXPECT_TRUE(escaped.readOnly);
  EXPECT_TRUE(table.mounts()[3].readOnly);
  EXPECT_FALSE(table.mounts()[1].readOnly);
  EXPECT_EQ(table.mounts()[4].source, "");
  EXPECT_EQ(table.mounts()[4].options, "rw,size=4k");
}

TEST(MountTable, FollowsAPathIntoTheMountThatIsSeen) {
  const MountTable table(
      "27 1 8:1 / / rw - ext4 /dev/sda1 rw\n"
      "28 27 8:2 / /a/b rw - ext4 /dev/sda2 rw\n"  // hidden by the next
      "29 27 8:3 / /a rw - ext4 /dev/sda3 rw\n"    //
      "30 29 8:4 / /a/c rw - ext4 /dev/sda4 rw\n"  // covered by the next
      "31 30 8:5 / /a/c rw - ext4 /dev/sda5 rw\n"  //
      "32 31 8:6 /x /a/c/d rw - ext4 /dev/sda6 rw\n"
      "33 27 8:6 / /whole rw - ext4 /dev/sda6 rw\n");
  for (const auto& [path, point, minor] :
       {std::tuple("/", "/", 1U), std::tuple("/ab", "/", 1U), std::tuple("/a/b/file", "/a", 3U),
        std::tuple("/a/c", "/a/c", 5U), std::tuple("/a/c/d/e", "/a/c/d", 6U)}) {
    const auto* mount = table.holding(path);
    ASSERT_NE(mount, nullptr) << path;
    EXPECT_EQ(mount->point, point) << path;
    EXPECT_EQ(mount->device.minor, minor) << path;
  }
  EXPECT_EQ(table.holding("relative"), nullptr);
  EXPECT_EQ(pointOf(table.mountOf({8, 1})), "/");
  EXPECT_EQ(pointOf(table.mountOf({8, 2})), "none");
  EXPECT_EQ(pointOf(table.mountOf({8, 4})), "none");
  EXPECT_EQ(pointOf(table.mountOf({8, 6})), "/whole");
}

#ifdef __SANITIZE_THREAD__
constexpr std::chrono::seconds inItsStride(15);
#else
constexpr std::chrono::seconds inItsStride(3);
#endif

TEST(MountTable, TakesTenThousandMountsInItsStride) {
  std::string text = "27 1 8:1 / / rw - ext4 /dev/sda1 rw\n";
  for (int id = 100; id < 10100; ++id)
    text += std::to_string(id) + " 27 7:" + std::to_string(id) + " / /Volumes/some/folder/v" + std::to_string(id) +
            " rw,relatime - ext4 /dev/loop rw\n";
  const auto began = std::chrono::steady_clock::now();
  const MountTable table(text);
  EXPECT_EQ(pointOf(table.holding("/Volumes/some/folder/v9000/a")), "/Volumes/some/folder/v9000");
  EXPECT_LT(std::chrono::steady_clock::now() - began, inItsStride);
}

}  // namespace
}  // namespace tavisk
