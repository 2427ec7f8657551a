// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/ProcessScan.h"

namespace tavisk {
namespace {

using testing::IsEmpty, testing::UnorderedElementsAre;

TEST(ProcessScan, FindsRunningProgramsOfThisMachine) {
  LinuxTree tree;
  auto process = [&](const std::string& id, const std::string& stat, const std::string& commandLine) {
    tree.write("/proc/" + id + "/stat", stat);
    tree.write("/proc/" + id + "/cmdline", commandLine);
    tree.link("/proc/" + id + "/ns/pid", "pid:[1]");
  };
  tree.link("/proc/self", "5");
  process("5", "5 (chronyd) R 1", "chronyd");
  process("10", "10 (chronyd) S 1 10", std::string("/usr/sbin/chronyd\0-F", 20));
  process("11", "11 (chronyd) Z 1", "chronyd");
  process("12", "12 (chronyd) S 2", "");
  process("13", "13 (x) S (chronyd) S 1", "chronyd");
  process("14", "14 (chronyd) S 1", "chronyd");
  tree.link("/proc/14/ns/pid", "pid:[2]");
  process("15", "15 (systemd-timesyn) S 1", "/lib/systemd/systemd-timesyncd");
  process("16", "16 (systemd-timesyn) S 1", "systemd-timesynth");
  process("17", "17 (systemd-timesyn) S 1", "renamed");
  tree.link("/proc/17/exe", "/lib/systemd/systemd-timesyncd (deleted)");
  process("18", "garbage", "chronyd");
  tree.write("/proc/uptime", "1");
  EXPECT_THAT(processesNamed(tree.root, "chronyd").valueOr({}), UnorderedElementsAre(10));
  EXPECT_THAT(processesNamed(tree.root, "systemd-timesyncd").valueOr({}), UnorderedElementsAre(15, 17));
  EXPECT_THAT(processesNamed(tree.root, "systemd-timesyn").valueOr({}), UnorderedElementsAre(15, 16, 17));
  EXPECT_THAT(processesNamed(SystemRoot("/nowhere"), "chronyd").valueOr({0}), IsEmpty());
  for (const char* path : {"/proc/15/cmdline", "/proc/11/stat", "/proc/10/ns", "/proc"}) {
    tree.makeUnreadable(path);
    EXPECT_FALSE(processesNamed(tree.root, "systemd-timesyncd")) << path;
    std::filesystem::remove(tree.at(path));
    EXPECT_TRUE(processesNamed(tree.root, "systemd-timesyncd")) << path << " is gone";
  }
}

}  // namespace
}  // namespace tavisk
