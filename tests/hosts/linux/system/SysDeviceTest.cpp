// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/SysDevice.h"

namespace tavisk {
namespace {

TEST(SysDevice, IsAbsentOnlyWhenNothingIsThere) {
  LinuxTree tree;
  tree.write("/sys/devices/a/power/wakeup", "enabled");
  tree.makeUnreadable("/sys/devices/b");
  EXPECT_EQ(SysDevice::at(tree.root, "/sys/devices/c").valueOr(SysDevice::at(tree.root, "/sys/devices/a").value()),
            std::nullopt);
  EXPECT_FALSE(SysDevice::at(tree.root, "/sys/devices/b"));
  const auto device = SysDevice::at(tree.root, "/sys/devices/a").value().value();
  EXPECT_EQ(device.subsystem().valueOr("failed"), "");
  tree.makeUnreadable("/sys/devices/a/subsystem");
  tree.makeUnreadable("/sys/devices/a/power");
  EXPECT_FALSE(device.canWake());
  for (const int error : {ENOENT, ENODEV, ENXIO, ENOMEDIUM}) EXPECT_TRUE(isGone(systemFailure("", "", error))) << error;
  for (const int error : {EIO, EMFILE, EACCES}) EXPECT_FALSE(isGone(systemFailure("", "", error))) << error;
}

}  // namespace
}  // namespace tavisk
