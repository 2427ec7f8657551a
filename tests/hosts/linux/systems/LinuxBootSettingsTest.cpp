// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/TracedRun.h"
#include "hosts/linux/firmware/BootTree.h"
#include "hosts/linux/systems/LinuxBootSettings.h"
#include "platform/DiskManagementContract.h"

namespace tavisk {
namespace {

struct LinuxDiskMachine {
  LinuxDiskMachine() {
    tree.addDisk(inside.text, "8:0", 8192);
    tree.addDisk(stick.text, "8:16", 64, DiskTree::usb);
    tree.setSubsystem("/devices/pci0000:00/0000:00:14.0/usb1/1-2", "usb");
    tree.addDisk(disc.text, "11:0", 2048, "/devices/pci0000:00/0000:00:1f.2/ata2/host1/target1:0:0/1:0:0:0");
    tree.addDisk(image.text, "7:0", 64, "/devices/virtual");
    tree.know("8:0", "E:ID_PART_TABLE_TYPE=gpt\n");
    tree.know("8:16", "E:ID_PART_TABLE_TYPE=mac\n");
    tree.know("11:0", DiskTree::bootableDvd);
    tree.setEntry(0, {fileNode(R"(\EFI\debian\shimx64.efi)")});
    tree.setOrder({0});
  }
  DiskManagementService& service() { return tree.host().diskManagement(); }
  void refuseSets() {}  // no volume has a boot file, and the variable is the firmware's own
  std::map<std::string, std::string> kept() const { return tree.allVariables(); }
  std::string variable(const char* name) const {
    constexpr std::size_t attributesSize = 4;
    return tree.file(EfiVariables::pathOf({name, efiOwnVendor})).substr(attributesSize);
  }

  const bool maySet = ::geteuid() == 0;
  const DiskName inside{"sda"};
  const DiskName stick{"sdb"};
  const DiskName disc{"sr0"};
  const DiskName image{"loop0"};
  BootTree tree;
  EffectLog& log = tree.log;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, DiskManagementContract, LinuxDiskMachine);

constexpr const char* systemFolder = "/System/Library/CoreServices";
const std::string mainFile = systemFolder + std::string("/boot.efi");
const std::string backupFile = "/Volumes/Backup" + mainFile;
constexpr const char* mainUuid = "0f1e2d3c-4b5a-6978-8796-a5b4c3d2e1f0";
constexpr const char* backupPath = R"(HD(1,MBR,11223344-01,0x800,0x800)/File(\System\Library\CoreServices\boot.efi))";
constexpr const char* ownFile = R"(\System\Library\CoreServices\boot.efi)";
constexpr const char* otherPath = R"(File(\EFI\debian\shimx64.efi))";

/// Main (ext4, sda2) with its EFI system partition (sda1), and Backup (FAT, sdb1 of an MBR disk).
class LinuxBootSettingsTest : public testing::Test {
 protected:
  void SetUp() override {
    if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
    addMain();
    addBackup();
    if (!_hasTools) GTEST_SKIP() << "sgdisk, mkfs.vfat or mkfs.ext4 is missing";
    tree.setEntry(0, {fileNode(R"(\EFI\debian\shimx64.efi)")});
    tree.setOrder({0});
  }

  LinuxBootSettings settings() { return LinuxBootSettings(tree.machine, _disks, _systems); }
  ServiceStatus set(const std::string& disk, const std::string& volume) {
    return settings().setBootPreference({{disk}, volume + systemFolder, false});
  }
  std::string preferredDisk() {
    const auto preference = settings().bootPreference();
    EXPECT_EQ(preference.status == 0, preference.disk.has_value());
    return preference.disk ? preference.disk->text : "";
  }
  void expectRefused(const std::string& disk, const std::string& volume, const std::string& why) {
    const auto before = tree.allVariables();
    EXPECT_NE(set(disk, volume), 0) << why;
    EXPECT_THAT(tree.lastEffect(), FailedFor(why));
    EXPECT_EQ(tree.allVariables(), before) << why;
    EXPECT_FALSE(tree.has(LinuxBootSettings::previousOrder)) << why;
  }
  /// Of a set from one start to another, both as device paths, which made this entry.
  static Effect effectOf(Outcome outcome, const std::string& before, const std::string& after,
                         const std::string& made = "") {
    const auto entry = made.empty() ? "" : ", " + BootTree::pathOf(made);
    const auto where = std::string(LinuxBootSettings::previousOrder) + ", " + BootTree::pathOf("BootOrder") + entry;
    return {.setting = setting::startupDisk,
            .outcome = outcome,
            .before = before,
            .asked = after,
            .stored = after,
            .where = outcome == Outcome::applied ? where : "",
            .changed = outcome == Outcome::applied};
  }

  BootTree tree;

 private:
  void addMain() {
    tree.addDisk("sda", "8:0", 65536);
    tree.addPartition("sda", 1, "8:1", 2048, 2048);
    tree.addPartition("sda", 2, "8:2", 4096, 8192);
    _hasTools &= runTool("sgdisk -n 1:2048:4095 -t 1:ef00 -u 1:6C8F1B52-0E5A-4E0C-9B66-0123456789AB -n 2:4096:12287 " +
                         tree.addImage("sda", 65536));
    _hasTools &= runTool("mkfs.vfat " + tree.addImage("sda1", 2048));
    _hasTools &= runTool("mkfs.ext4 -L Main -U " + std::string(mainUuid) + " " + tree.addImage("sda2", 8192));
    tree.mount("8:2", "/dev/sda2", "/", "ext4");
    tree.mount("8:1", "/dev/sda1", "/boot/efi", "vfat");
  }
  void addBackup() {
    tree.addDisk("sdb", "8:16", 8192, DiskTree::usb);
    tree.addPartition("sdb", 1, "8:17", 2048, 2048, DiskTree::usb);
    tree.addMbr("sdb", 8192, 0x0C);
    _hasTools &= runTool("mkfs.vfat -n BACKUP " + tree.addImage("sdb1", 2048));
    tree.mount("8:17", "/dev/sdb1", "/Volumes/Backup", "vfat");
    tree.write(backupFile, firmwareProgram());
  }

  bool _hasTools = true;
  LinuxDisks _disks{tree.machine};
  LinuxSystems _systems{tree.machine, _disks, [](const auto&) {}};
};

TEST_F(LinuxBootSettingsTest, StartsTheVolumesOwnFile) {
  EXPECT_EQ(set("sdb1", "/Volumes/Backup"), 0);
  EXPECT_EQ(tree.lastEffect(), effectOf(Outcome::applied, otherPath, backupPath, "Boot0001"));
  const EfiVariables variables(tree.root);
  const auto first = BootEntries(variables).first().valueOr(std::nullopt);
  ASSERT_TRUE(first);
  EXPECT_EQ(targetText(first->option), backupPath);
  EXPECT_EQ(first->option.description, "tavisk BACKUP");
  EXPECT_EQ(tree.file(LinuxBootSettings::previousOrder), "0000\n");
  EXPECT_EQ(preferredDisk(), "sdb1");
  const auto before = tree.allVariables();
  EXPECT_EQ(set("sdb1", "/Volumes/Backup"), 0);
  EXPECT_EQ(tree.lastEffect(), effectOf(Outcome::unchanged, backupPath, backupPath));
  EXPECT_EQ(tree.allVariables(), before);
  tree.setOrder({0, 1});
  EXPECT_EQ(set("sdb1", "/Volumes/Backup"), 0);
  EXPECT_EQ(tree.lastEffect(), effectOf(Outcome::applied, otherPath, backupPath)) << "the entry was there";
}

TEST_F(LinuxBootSettingsTest, StartsAVolumeThatFirmwareCannotReadFromItsFileBeside) {
  tree.write("/boot/efi/EFI/tavisk/" + std::string(mainUuid) + "/boot.efi", firmwareProgram());
  const auto path = R"(HD(1,GPT,6c8f1b52-0e5a-4e0c-9b66-0123456789ab,0x800,0x800)/File(\EFI\tavisk\)" +
                    std::string(mainUuid) + R"(\boot.efi))";
  EXPECT_EQ(set("sda2", ""), 0);
  EXPECT_EQ(tree.lastEffect(), effectOf(Outcome::applied, otherPath, path, "Boot0001"));
  EXPECT_EQ(preferredDisk(), "sda2") << "the volume it was made for, not the partition that has the file";
  tree.link("/dev/disk/by-uuid/" + std::string(mainUuid), "../../sdb1");
  EXPECT_EQ(preferredDisk(), "sda2") << "not a copy of it on another disk";
}

struct Refusal {
  const char* disk;
  const char* volume;
  const char* why;
  std::function<void(BootTree&)> prepare = nullptr;
};

const Refusal refusals[] = {
    {"sdz", "", "no such disk"},
    {"sdb1", "/Volumes/Other", "/Volumes/Other"},
    {"sdb1", "", "it is not on sdb1"},
    {"sda2", "", "does not read ext4"},
    {"sda2", "", "there is no such file"},
    {"sda2", "", "it holds ext4",
     [](auto& tree) {
       auto mounts = tree.file("/proc/thread-self/mountinfo");
       tree.setMounts(mounts.replace(mounts.find("vfat"), 4, "ext4"));
     }},
    {"sdb1", "/Volumes/Backup", "too short for a variable",
     [](auto& tree) { tree.write(BootTree::pathOf("SecureBoot"), "odd"); }},
    {"sdb1", "/Volumes/Backup", "Secure Boot is on", [](auto& tree) { tree.setVariable("SecureBoot", "\1"); }},
    {"sdb1", "/Volumes/Backup", "not a program", [](auto& tree) { tree.write(backupFile, "#!/bin/sh\n"); }},
    {"sdb1", "/Volumes/Backup", "No such file", [](auto& tree) { std::filesystem::remove(tree.at(backupFile)); }},
    {"sdb1", "/Volumes/Backup", "the same identity 11223344-01",
     [](auto& tree) {
       std::filesystem::copy_file(tree.at("/dev/sdb"), tree.at("/dev/sdc"));
       tree.addDisk("sdc", "8:32", 8192);
       tree.addPartition("sdc", 1, "8:33", 2048, 2048);
     }},
};

TEST_F(LinuxBootSettingsTest, RefusesWhatFirmwareWouldNotStart) {
  tree.write(mainFile, firmwareProgram());
  preferredDisk();  // what is known of the disks from now on does not count for a set
  const auto mounts = tree.file("/proc/thread-self/mountinfo");
  for (const auto& refusal : refusals) {
    if (refusal.prepare) refusal.prepare(tree);
    expectRefused(refusal.disk, refusal.volume, refusal.why);
    tree.setMounts(mounts);
    tree.write(backupFile, firmwareProgram());
    std::filesystem::remove(tree.at(BootTree::pathOf("SecureBoot")));
  }
}

TEST_F(LinuxBootSettingsTest, StartsASignedFileUnderSecureBoot) {
  tree.setVariable("SecureBoot", "\1");
  tree.write(backupFile, firmwareProgram(true, 10, 16, 0x400));
  EXPECT_EQ(set("sdb1", "/Volumes/Backup"), 0);
}

TEST_F(LinuxBootSettingsTest, KnowsAPartitionByItsIdentityAlone) {
  EXPECT_EQ(preferredDisk(), "");
  EXPECT_THAT(tree.lastEffect(), FailedFor("Boot0000 (other)"));
  tree.setEntry(4, {*partitionNode({"6c8f1b52-0e5a-4e0c-9b66-0123456789ab", 9, 1, 1}), fileNode(ownFile)});
  tree.setOrder({4, 0});
  EXPECT_EQ(preferredDisk(), "sda1");
}

TEST_F(LinuxBootSettingsTest, TellsOfTheNextStartAlone) {
  tree.setEntry(5, {*partitionNode({"ffffffff-0e5a-4e0c-9b66-0123456789ab", 1, 1, 1})});
  tree.setVariable("BootNext", std::string("\5\0", 2));
  EXPECT_EQ(preferredDisk(), "") << "gone with its disk";
  EXPECT_EQ(set("sdb1", "/Volumes/Backup"), 0);
  auto expected = effectOf(Outcome::applied, otherPath, backupPath, "Boot0001");
  expected.note = "the next start alone is from Boot0005 (other), as BootNext says";
  EXPECT_EQ(tree.lastEffect(), expected);
  tree.setEntry(5, {*partitionNode({"6c8f1b52-0e5a-4e0c-9b66-0123456789ab", 1, 1, 1}), fileNode(ownFile)});
  tree.log.wants = true;
  EXPECT_EQ(preferredDisk(), "sda1");
  EXPECT_THAT(tree.log.values, testing::ElementsAre(SettingValue{setting::startupDisk, "sda1", "sdb1"}));
}

TEST_F(LinuxBootSettingsTest, KnowsTheStartOverANetwork) {
  const EfiPathNode hardwareAddress{3, 11, fromHex("525400123456" + std::string(52, '0') + "01")};
  tree.setEntry(1, {hardwareAddress, {3, 12, fromHex("00000000c0a80001" + std::string(30, '0'))}});
  tree.setOrder({1, 0});
  EXPECT_NE(settings().networkBootPreference().status, 0) << "no such interface here";
  tree.write("/sys/class/net/lo/address", "00:00:00:00:00:00\n");
  tree.write("/sys/class/net/eth0/address", "52:54:00:12:34:56\n");
  const auto network = settings().networkBootPreference();
  EXPECT_EQ(network.status, 0);
  EXPECT_EQ(network.interface, "eth0");
  EXPECT_EQ(network.server, "192.168.0.1");
  const auto disk = settings().bootPreference();
  EXPECT_EQ(disk.status, 0);
  EXPECT_FALSE(disk.disk);
}

TEST_F(LinuxBootSettingsTest, HasNoChoiceUnderOtherFirmware) {
  EXPECT_FALSE(settings().legacyBootSupport().supported);
  const auto shown = tree.at(BootTree::variables);
  std::filesystem::rename(shown, tree.at("/hidden"));
  EXPECT_EQ(settings().legacyBootSupport().status, 0);
  EXPECT_THAT(tree.log.effects, testing::IsEmpty()) << "a machine that does not show its variables has none";
  std::filesystem::rename(tree.at("/hidden"), shown);
  tree.setEntry(8, {{5, 1, fromHex("0200000048440000")}});
  EXPECT_TRUE(settings().legacyBootSupport().supported) << "by the old rules";
  std::filesystem::remove_all(tree.at("/sys/firmware/efi"));
  EXPECT_EQ(settings().preBootEnvironment(), preboot::noneKnown);
  EXPECT_TRUE(settings().legacyBootSupport().supported);
  EXPECT_NE(set("sdb1", "/Volumes/Backup"), 0);
  EXPECT_THAT(tree.lastEffect(), UnsupportedFor("not started by UEFI"));
  tree.log.effects.clear();
  tree.log.wants = true;
  EXPECT_EQ(settings().networkBootPreference().status, 0);
  EXPECT_EQ(preferredDisk(), "");
  EXPECT_THAT(tree.log.effects, testing::IsEmpty()) << "a read has not failed";
  const Failure why{"read", "the firmware's variables", "this machine was not started by UEFI firmware"};
  EXPECT_THAT(tree.log.values, testing::ElementsAre(SettingValue{setting::networkStartupDisk, {}, {}, "", why},
                                                    SettingValue{setting::startupDisk, {}, {}, "", why}));
  tree.write("/sys/firmware/devicetree/base/ibm,opal", "");
  EXPECT_EQ(settings().preBootEnvironment(), preboot::openFirmware);
}

TEST_F(LinuxBootSettingsTest, LosesNothingAndTellsNothingUntrueWhicheverCallFailsOrIsItsLast) {
  if (!canTraceCalls()) GTEST_SKIP() << "calls cannot be traced here";
  tree.setOrder({0, 7});
  const auto before = tree.allVariables();
  const auto order = std::string("BootOrder-") + efiGlobalVendor;
  const std::string newOrder("\7\0\0\0\1\0\0\0\7\0", 10);
  const auto doSet = [&] { return set("sdb1", "/Volumes/Backup"); };
  for (const auto& [error, isChosen, fewest] : {std::tuple(0, &mayChangeFiles, 8), {EIO, &opensOrChangesFiles, 100}}) {
    int call = 0;
    int successes = 0;
    for (TracedRun run{true}; run.wentWrong; ++call) {
      SCOPED_TRACE(call);
      run = runWithFault(call, error, isChosen, doSet);
      auto after = tree.allVariables();
      EXPECT_TRUE(after[order] == newOrder || (run.status != 0 && after[order] == before.at(order)));
      EXPECT_LE(after.size(), before.size() + 1);
      for (const auto& [name, contents] : before) EXPECT_TRUE(name == order || after[name] == contents) << name;
      if (run.status == 0 || (error != 0 && tree.has(LinuxBootSettings::previousOrder))) {
        EXPECT_EQ(tree.file(LinuxBootSettings::previousOrder), "0000,0007\n");
      }
      successes += run.status == 0 ? 1 : 0;
      if (error == 0) {
        doSet();
        after = tree.allVariables();
        EXPECT_EQ(after[order], newOrder) << "what was left is used again";
        EXPECT_EQ(after.size(), before.size() + 1);
      }
      std::filesystem::remove(tree.at(BootTree::pathOf("Boot0001")));
      std::filesystem::remove_all(tree.at("/var"));
      tree.setOrder({0, 7});
    }
    EXPECT_GT(call, fewest) << "the work was not traced";
    EXPECT_GT(successes, 0);
  }
}

TEST_F(LinuxBootSettingsTest, SetsNothingByWhatCouldNotBeLookedAt) {
  for (const char* file : {"/etc/default/keyboard", "/etc/locale.conf", LinuxUserDefaults::file}) {
    tree.makeUnreadable(file);
    const auto layout = tree.host().keyboardInput().currentLayoutNumber();
    const auto languages = tree.host().userDefaults().strings("VelmarLanguages");
    ASSERT_NE(static_cast<bool>(layout), static_cast<bool>(languages)) << file;
    const auto& why = layout ? languages.failure() : layout.failure();
    EXPECT_NE(settings().setFirmwareVariable("prev-lang:kbd", why), 0) << file;
    EXPECT_THAT(tree.lastEffect(), FailedFor(file));
    std::filesystem::remove(tree.at(file));
  }
  EXPECT_FALSE(tree.has(EfiVariables::pathOf({"prev-lang:kbd", efiOwnVendor})));
  std::filesystem::remove_all(tree.at("/sys/firmware/efi"));
  tree.link("/sys/firmware/efi", "efi");
  EXPECT_EQ(settings().preBootEnvironment(), preboot::noneKnown);
  EXPECT_THAT(tree.lastEffect(), FailedFor("/sys/firmware/efi"));
  EXPECT_NE(settings().networkBootPreference().status, 0);
  for (int times = 0; times < 2; ++times) {
    EXPECT_NE(set("sdb1", "/Volumes/Backup"), 0);
    EXPECT_THAT(tree.lastEffect(), FailedFor("/sys/firmware/efi")) << "not \"not supported\"";
  }
}

}  // namespace
}  // namespace tavisk
