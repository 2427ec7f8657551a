// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/services/ServicesConfig.h"

namespace tavisk {
namespace {

TEST(ServicesConfig, NamesUnitsThatMayBeSwitched) {
  const std::pair<const char*, std::vector<std::string>> cases[] = {
      {"", {}},
      {"# remote-events = a.service\nother = b.service\n", {}},
      {"remote-events = a.service\nremote-events=b@1.socket  my-group.target\r\n", {"b@1.socket", "my-group.target"}},
      {"remote-events =\n", {}},
  };
  for (const auto& [text, units] : cases) {
    LinuxTree tree;
    tree.write(servicesConfig, text);
    EXPECT_EQ(configuredUnits(SystemRoot(tree.at("/")), "remote-events").valueOr({"failed"}), units) << text;
  }
  for (const char* unit : {"a", ".service", "a.mount", "a/b.service", "../a.service", "dbus.service", "dbus.socket",
                           "systemd-journald.service", "reboot.target", "remote-fs-pre.target", "hybrid-sleep.target",
                           "multi-user.target", "runlevel0.target"}) {
    LinuxTree tree;
    tree.write(servicesConfig, std::string("remote-events = a.service ") + unit);
    EXPECT_FALSE(configuredUnits(SystemRoot(tree.at("/")), "remote-events")) << unit;
  }
}

}  // namespace
}  // namespace tavisk
