// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/SysDevice.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* own = "/etc/systemd/logind.conf.d/60-tavisk.conf";

TEST(SystemdConfig, KeepsWhatItCannotRead) {
  LinuxTree tree;
  const SystemRoot root(tree.at("/"));
  const SystemdConfig config(root, "logind.conf");
  tree.write(own, "[Login]\nHandlePowerKey=suspend\n");
  ASSERT_TRUE(config.setOwn("Login", {{"IdleAction", "ignore"}}));
  EXPECT_NE(tree.file(own).find("HandlePowerKey=suspend\nIdleAction=ignore\n"), std::string::npos);
  const std::string tooLarge(configurationLimit + 1, '#');
  tree.write(own, tooLarge);
  EXPECT_FALSE(config.setOwn("Login", {{"IdleAction", "suspend"}}));
  EXPECT_EQ(tree.file(own), tooLarge);
}

TEST(SystemdConfig, TellsThatItCouldNotLook) {
  for (const char* path : {"/etc/systemd/logind.conf", "/run/systemd/logind.conf.d", own}) {
    LinuxTree tree;
    const SystemRoot root(tree.at("/"));
    const SystemdConfig config(root, "logind.conf");
    EXPECT_TRUE(config.last("Login", "IdleAction")) << "nothing there is no failure";
    tree.makeUnreadable(path);
    EXPECT_FALSE(config.last("Login", "IdleAction")) << path;
    EXPECT_FALSE(config.words("Login", "IdleAction")) << path;
    EXPECT_FALSE(config.whatHides("Login", {"IdleAction"})) << path;
  }
}

TEST(SysDevice, IsAbsentOnlyWhenNothingIsThere) {
  LinuxTree tree;
  const SystemRoot root(tree.at("/"));
  tree.write("/sys/devices/a/power/wakeup", "enabled");
  tree.makeUnreadable("/sys/devices/b");
  EXPECT_EQ(SysDevice::at(root, "/sys/devices/c").valueOr(SysDevice::at(root, "/sys/devices/a").value()), std::nullopt);
  EXPECT_FALSE(SysDevice::at(root, "/sys/devices/b"));
  const auto device = SysDevice::at(root, "/sys/devices/a").value().value();
  EXPECT_EQ(device.subsystem().valueOr("failed"), "");
  tree.makeUnreadable("/sys/devices/a/subsystem");
  tree.makeUnreadable("/sys/devices/a/power");
  EXPECT_FALSE(device.canWake());
  for (const auto& [error, isIt] : {std::pair(ENOENT, true),
                                    {ENODEV, true},
                                    {ENXIO, true},
                                    {ENOMEDIUM, true},
                                    {EIO, false},
                                    {EMFILE, false},
                                    {EACCES, false}})
    EXPECT_EQ(isGone(systemFailure("read", "x", error)), isIt) << error;
}

}  // namespace
}  // namespace tavisk
