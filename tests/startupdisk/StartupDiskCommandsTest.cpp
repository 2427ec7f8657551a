// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "StartupDiskTest.h"
#include "ToolRun.h"

namespace tavisk {
namespace {

/// Lumara X on the root volume "Main", on "Backup", and Windows on "Win".
struct CommandMachine : StartupMachine {
  CommandMachine() {
    addVolume("disk0s2", "Main", keys({{"Mount Point", "/"}}));
    installLumaraX("");
    addLumaraX("disk1s2", "Backup");
    addVolume("disk2s1", "Win", keys({{"Kind", "ntfs"}}));
    writeFile("/Volumes/Win/WINDOWS/SYSTEM.INI", "");
    set("Firmware", "Legacy Boot", true);
    set("Firmware", "Boot Preference", keys({{"Disk", "disk1s2"}}));
  }
};

TEST(StartupDiskCommands, ListAndShow) {
  CommandMachine machine;
  const auto result = runTool(machine, {"-setstartupdisk", "nowhere", "-liststartupdisks", "-getstartupdisk"});
  EXPECT_EQ(result.output,
            "Not a System Folder: /Volumes/nowhere/System/Library/CoreServices\n"
            "/System/Library/CoreServices\n/Volumes/Backup/System/Library/CoreServices\n/Volumes/Win/WINDOWS\n"
            "/Volumes/Backup/System/Library/CoreServices\n");
  EXPECT_EQ(result.status, 0) << "the getters clear the flag";
}

TEST(StartupDiskCommands, PrintNothingWhereNothingIsKnown) {
  ScratchMachine machine;
  const auto result = runTool(machine, {"-liststartupdisks", "-getstartupdisk"});
  EXPECT_EQ(result.output, "");
  EXPECT_EQ(result.status, 0);
  machine.set("Firmware", "Network Preference", keys({{"Interface", "en0"}}));
  EXPECT_EQ(runTool(machine, {"-getstartupdisk"}).output, "") << "any network image has no folder";
}

TEST(StartupDiskCommands, SetByFolderNameOrMountPoint) {
  const std::string root = "/System/Library/CoreServices";
  const std::string backup = "/Volumes/Backup" + root;
  const auto set = [](const std::string& folder) { return "Set Startup Disk to Path: " + folder + "\n"; };
  const auto unknown = [](const std::string& folder) { return "Not a System Folder: " + folder + "\n"; };
  struct Case {
    const char* argument;
    std::string output;
    const char* disk;  ///< from which the machine starts afterwards
  };
  const Case cases[] = {
      {"Backup", set(backup), "disk1s2"},
      {"/Volumes/Backup", set(backup), "disk1s2"},
      {backup.c_str(), set(backup), "disk1s2"},
      {"Main", set(root), "disk0s2"},
      {root.c_str(), set(root), "disk0s2"},
      {"/Volumes/Backup/", unknown("/Volumes/Backup/" + root), "disk9"},
      {"/", unknown("/Volumes//" + root), "disk9"},
      {"main", unknown("/Volumes/main" + root), "disk9"},
      {"Win", unknown("/Volumes/Win" + root), "disk9"},
      {"/Volumes/Win/WINDOWS", unknown("/Volumes/Win/WINDOWS" + root), "disk9"},
      {"", "setStartupDisk: Error, you must specify a valid startup disk. Command usage: 'setstartupdisk <disk>'\n",
       "disk9"},
  };
  for (const auto& test : cases) {
    CommandMachine machine;
    machine.set("Firmware", "Boot Preference", keys({{"Disk", "disk9"}}));
    const auto result = runTool(machine, {"-setstartupdisk", test.argument});
    EXPECT_EQ(result.output, test.output);
    EXPECT_EQ(result.status, result.output.starts_with("Set") ? 0 : 1) << test.argument;
    EXPECT_EQ(*machine.get("Firmware", "Boot Preference")->asDictionary()->find("Disk"), PropertyList(test.disk));
  }
}

TEST(StartupDiskCommands, TellWhatCannotBeSet) {
  CommandMachine machine;
  machine.refuse("*", "read-only");
  const auto result = runTool(machine, {"-setstartupdisk", "Backup", "-getstartupdisk", "-setstartupdisk", "Backup"});
  const std::string line = "Can't set startup disk to /Volumes/Backup/System/Library/CoreServices\n";
  EXPECT_EQ(result.output, line + "/Volumes/Backup/System/Library/CoreServices\n" + line);
  EXPECT_EQ(result.status, 1);
}

TEST(StartupDiskCommands, ShowWhatWasSetAndWhereALinkLeads) {
  CommandMachine machine;
  const auto mounted = machine.directory() + "/root/Links";
  std::filesystem::create_directory_symlink("/Volumes/Backup", mounted);
  machine.addVolume("disk1s2", "Backup", keys({{"Mount Point", "/Links"}}));
  EXPECT_EQ(runTool(machine, {"-liststartupdisks", "-setstartupdisk", "Main", "-getstartupdisk"}).output,
            "/System/Library/CoreServices\n/Volumes/Backup/System/Library/CoreServices\n/Volumes/Win/WINDOWS\n"
            "Set Startup Disk to Path: /System/Library/CoreServices\n/System/Library/CoreServices\n");
}

}  // namespace
}  // namespace tavisk
