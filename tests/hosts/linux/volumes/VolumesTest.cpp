// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>

#include "TemporaryFolder.h"
#include "hosts/linux/volumes/OsRelease.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {
namespace {

using testing::HasSubstr;

Volume volume(const std::string& name, const VolumeFacts& facts, std::optional<PartitionFacts> partition = {},
              std::vector<std::string> nodes = {}) {
  BlockDevice device;
  device.name = {name};
  return {device, {name.substr(0, 3)}, facts, std::move(partition), std::move(nodes)};
}

VolumeFacts ext4(const std::string& label, const std::string& uuid) {
  return {"ext4", "filesystem", label, uuid, {}};
}

TEST(Volumes, AreNamedAsAKernelsRootAndNeverGuessed) {
  const Volumes volumes(
      {volume("sda1", {"vfat", "filesystem", "EFI", "1A2B-3C4D", {}}, PartitionFacts{1, 0, 0, "aa01", "esp", "EFI"}),
       volume("sda2", ext4("Server/Root", "0f1e"), PartitionFacts{2, 0, 0, "aa02", "linux", "Main part"}),
       volume("sda3", ext4("Twin", "beef"), PartitionFacts{3, 0, 0, "aa03", "linux", "Twin"}),
       volume("sdb3", ext4("Twin", "BEEF"), PartitionFacts{3, 0, 0, "AA03", "linux", "Twin"}),
       volume("dm-0", {"xfs", "filesystem", {}, "c0de", {}}, {}, {"/dev/mapper/vg--a-root", "/dev/vg-a/root"}),
       volume("dm-1", {"xfs", "filesystem", "", "", {}})},
      [](const Volume&) { return Failure{}; });
  const struct {
    std::string root;
    std::string name;  ///< or the reason why there is none
  } cases[] = {
      {"UUID=0F1E", "sda2"},
      {"UUID=\"0f1e\"", "sda2"},
      {"'UUID=1a2b-3c4d'", "sda1"},
      {"LABEL=Server/Root", "sda2"},
      {"LABEL=server/root", "no volume here"},
      {"PARTUUID=AA02", "sda2"},
      {"PARTUUID=aa02/PARTNROFF=1", "no volume here"},
      {"PARTLABEL=Main part", "sda2"},
      {"/dev/disk/by-uuid/c0de", "dm-0"},
      {R"(/dev/disk/by-label/Server\x2fRoot)", "sda2"},
      {R"(/dev/disk/by-partlabel/Main\x20part)", "sda2"},
      {"/dev/disk/by-partuuid/aa01", "sda1"},
      {"/dev/mapper/vg--a-root", "dm-0"},
      {"/dev/vg-a/root", "dm-0"},
      {"/dev/vg-a/gone", "no volume here"},
      {"UUID=beef", "both sda3 and sdb3"},
      {"LABEL=Twin", "both sda3 and sdb3"},
      {"PARTUUID=aa03", "both sda3 and sdb3"},
      {"PARTLABEL=Twin", "both sda3 and sdb3"},
      {"UUID=", "no volume here"},
      {"LABEL=", "no volume here"},
      {"/dev/sda2", "change from start to start"},
      {"/dev/nvme0n1p2", "change from start to start"},
      {"/dev/dm-0", "change from start to start"},
      {"sda2", "change from start to start"},
  };
  for (const auto& [root, name] : cases) {
    const auto found = volumes.ofRootArgument(root);
    EXPECT_THAT(found ? (*found)->device.name.text : found.failure().why, HasSubstr(name)) << root;
  }
  EXPECT_EQ((*volumes.onDisk({"sda"}, "ESP"))->device.name.text, "sda1");
  EXPECT_EQ(*volumes.onDisk({"sdb"}, "esp"), nullptr);
  EXPECT_FALSE(volumes.onDisk({"sda"}, "linux"));
}

TEST(Volumes, ShareTheirNamesWithWhatIsNotLookedInto) {
  const PartitionFacts own{2, 0, 0, "aa02", "linux", "Main"};
  auto copy = volume("sdb2", ext4("Main", "0f1e"), own);
  auto unseen = volume("sda3", {"crypto_LUKS", "crypto", {}, {}, {}}, PartitionFacts{3, 0, 0, "aa03", "boot", ""});
  auto unknown = volume("sdc1", {});
  unknown.device.partition = 1;
  const Volumes volumes({volume("sda2", ext4("Main", "0f1e"), own), volume("sda4", ext4("", "beef"))},
                        [](const Volume&) { return Failure{}; }, {{copy}, {unseen, true}, {unknown, true}});
  for (const auto* root : {"UUID=0F1E", "LABEL=Main", "PARTUUID=aa02", "PARTLABEL=Main"}) {
    const auto found = volumes.ofRootArgument(root);
    EXPECT_THAT(found ? "found" : found.failure().why, HasSubstr("both sda2 and sdb2")) << root;
  }
  EXPECT_TRUE(volumes.withUuid("beef"));
  EXPECT_THAT(volumes.withPartitionUuid("aa03").failure().why, HasSubstr("not looked at"));
  EXPECT_EQ((*volumes.onDisk({"sda"}, "linux"))->device.name.text, "sda2");
  EXPECT_EQ(*volumes.onDisk({"sda"}, "esp"), nullptr);
  EXPECT_FALSE(volumes.onDisk({"sda"}, "boot")) << "it may be the one that is locked";
  EXPECT_FALSE(volumes.onDisk({"sdc"}, "esp")) << "nobody knows its type";
}

/// One volume whose files are those of a folder.
struct OneVolume {
  TemporaryFolder folder;
  Volumes volumes{{volume("sda2", ext4("Main", "0f1e"))}, [this](const Volume&) { return SystemRoot(folder.path()); }};

  Result<OsRelease> release(const std::string& subvolume) { return osReleaseOf(volumes, volumes.all()[0], subvolume); }
};

TEST(Volumes, TellAnAbsentFileFromAVolumeThatCannotBeOpened) {
  const OneVolume there;
  const auto absent = there.volumes.read(there.volumes.all()[0], "/boot", 10);
  EXPECT_TRUE(isAbsent(absent.failure()));
  EXPECT_EQ(absent.failure().on, "/boot on sda2");
  const Volumes gone({volume("sda2", {})}, [](const Volume&) { return systemFailure("mount", "/dev/sda2", ENOENT); });
  const auto unopened = gone.read(gone.all()[0], "/boot", 10);
  EXPECT_FALSE(isAbsent(unopened.failure()));
  EXPECT_EQ(describe(unopened.failure()), "mount on /dev/sda2: No such file or directory");
}

TEST(OsRelease, IsReadWhereASystemKeepsIt) {
  OneVolume system;
  EXPECT_TRUE(isAbsent(system.release("").failure()));
  system.folder.write("/usr/lib/os-release",
                      "NAME='Debian GNU/Linux'\nVERSION=\"12 (x)\"\nVERSION_ID=12\nID=debian\n"
                      "VERSION_CODENAME=bookworm\n");
  const auto debian = system.release("");
  EXPECT_EQ(debian->name, "Debian GNU/Linux");
  EXPECT_EQ(debian->version, "12");
  EXPECT_EQ(debian->build, "bookworm");
  system.folder.write("/etc/os-release", "VERSION=Rolling\nBUILD_ID=7\nVERSION_CODENAME=x\n");
  const auto rolling = system.release("");
  EXPECT_EQ(rolling->name + rolling->version + rolling->build, "LinuxRolling7");
  system.folder.write("/etc/os-release", std::string(65537, '#'));
  EXPECT_FALSE(system.release(""));
}

TEST(OsRelease, OfASubvolumeStaysInIt) {
  OneVolume system;
  system.folder.write("/usr/lib/os-release", "NAME=Other\n");
  system.folder.write("/@/usr/lib/os-release", "NAME=Own\n");
  std::filesystem::create_directories(system.folder.path() / "@/etc");
  std::filesystem::create_symlink("/usr/lib/os-release", system.folder.path() / "@/etc/os-release");
  EXPECT_EQ(system.release("@")->name, "Own");
  std::filesystem::create_symlink("/", system.folder.path() / "out");
  EXPECT_EQ(system.release("out")->name, "Other");
  EXPECT_TRUE(isAbsent(system.release("@home").failure()));
}

}  // namespace
}  // namespace tavisk
