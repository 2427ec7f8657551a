// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/linux/firmware/BootTree.h"
#include "hosts/linux/loaders/LoaderTexts.h"

namespace tavisk {

/// A server with two disks. On each is an EFI system partition with a signed GRUB, and a Debian whose menu starts it:
/// "First" (sda2), which runs, and "Second" (sdb2). Everything is mounted.
class InstalledTree : public BootTree {
 public:
  static constexpr const char* folder = "/System/Library/CoreServices";
  static constexpr const char* secondFolder = "/Volumes/Second/System/Library/CoreServices";
  static constexpr const char* firstMenu = "/boot/grub/grub.cfg";
  static constexpr const char* firstBlock = "/boot/grub/grubenv";

  explicit InstalledTree(bool isUefi = true) : _isUefi(isUefi) {
    addSystem("sda", "8:", 0, "/", "First", "aaaa");
    addSystem("sdb", "8:", 16, "/mnt/second", "Second", "cccc");
    if (!isUefi) return;
    setEntry(1, pathTo("6c8f1b52-0e5a-4e0c-9b66-000000000001"));
    setEntry(2, pathTo("6c8f1b52-0e5a-4e0c-9b66-000000000017"));
    setOrder({1, 2});
  }

  static EfiDevicePath pathTo(const std::string& partition) {
    return {*partitionNode({partition, 1, 2048, 2048}), fileNode(R"(\EFI\debian\shimx64.efi)")};
  }
  void setLabel(const std::string& number, const std::string& label) { know(number, factsOf(number, label)); }
  void setMenu(const std::string& point, const std::string& text) {
    write((point == "/" ? "" : point) + firstMenu, text);
  }
  /// What the first disks' watchers have been told after 0.2 s.
  void watch() {
    host().diskEvents().schedule(runLoop);
    runLoop.runUntil(RunLoop::Clock::now() + std::chrono::milliseconds(200));
  }
  std::string pointOf(const std::string& volume) {
    const auto disk = host().diskEvents().description({volume});
    return disk ? disk->volumePath.value_or("") : "no disk";
  }
  std::string preferred() {
    const auto preference = host().diskManagement().bootPreference();
    return preference.disk ? preference.disk->text : "status " + std::to_string(preference.status);
  }
  ServiceStatus choose(const std::string& volume, const std::string& system) {
    return host().diskManagement().setBootPreference({{volume}, system, false});
  }

  /// A file system whose mounts have a number of their own instead of their device's.
  void makeBtrfs(const std::string& number) {
    auto& facts = _facts[number];
    facts.replace(facts.find("=ext4"), 5, "=btrfs");
    setLabel(number, "Second");
    auto mounts = file("/proc/thread-self/mountinfo");
    mounts.replace(mounts.find(" " + number + " "), number.size() + 2, " 0:40 ");
    mounts.replace(mounts.find("- ext4", mounts.find(" 0:40 ")), 6, "- btrfs");
    setMounts(mounts);
  }

 private:
  std::string factsOf(const std::string& number, const std::string& label) {
    return _facts[number] + "E:ID_FS_LABEL_ENC=" + label + "\n";
  }
  void addPartitionOf(const std::string& disk, int partition, const std::string& number, const std::string& facts) {
    addPartition(disk, partition, number, static_cast<std::uint64_t>(partition) * 2048, 2048);
    _facts[number] = "E:ID_PART_ENTRY_NUMBER=" + std::to_string(partition) + "\nE:ID_FS_USAGE=filesystem\n" + facts;
    know(number, _facts[number]);
  }
  void addSystem(const std::string& disk, const std::string& major, int minor, const std::string& point,
                 const std::string& label, const std::string& uuid) {
    const auto number = [&](int partition) { return major + std::to_string(minor + partition); };
    const auto identity = "6c8f1b52-0e5a-4e0c-9b66-0000000000" + std::string(minor == 0 ? "0" : "1");
    const auto last = [&](int partition) { return identity + std::to_string((minor == 0 ? 0 : 6) + partition); };
    addDisk(disk, number(0), 65536);
    know(number(0), "E:ID_PART_TABLE_TYPE=gpt\n");
    if (!_isUefi) addCore(disk, point);
    addPartitionOf(disk, 1, number(1),
                   "E:ID_FS_TYPE=vfat\nE:ID_FS_UUID_ENC=AAAA-" + uuid + "\nE:ID_PART_ENTRY_UUID=" + last(1) +
                       "\nE:ID_PART_ENTRY_TYPE=" + efiSystemPartitionGuid + "\n");
    addPartitionOf(disk, 2, number(2),
                   "E:ID_FS_TYPE=ext4\nE:ID_FS_UUID_ENC=" + uuid + "\nE:ID_PART_ENTRY_UUID=" + last(2) +
                       "\nE:ID_PART_ENTRY_TYPE=0fc63daf-8483-4772-8e79-3d69d8477de4\n");
    setLabel(number(2), label);
    const auto top = point == "/" ? "" : point;
    mount(number(2), "/dev/" + disk + "2", point, "ext4");
    write(top + "/etc/os-release", "NAME=" + label + "\nVERSION_ID=\"12\"\nBUILD_ID=7\n");
    write(top + "/boot/vmlinuz", "a kernel");
    write(top + firstBlock, block("other=kept\n"));
    setMenu(point, menu("0", entry("gnulinux-simple-" + uuid, uuid, "UUID=" + uuid)));
    if (!_isUefi) return;
    mount(number(1), "/dev/" + disk + "1", top + "/boot/efi", "vfat");
    write(top + "/boot/efi/EFI/debian/shimx64.efi", shimProgram());
    write(top + "/boot/efi/EFI/debian/grubx64.efi", debianGrub());
    write(top + "/boot/efi/EFI/debian/grub.cfg", stub(uuid));
  }

  /// Both systems have an image, and the one of the first was written to its disk last.
  void addCore(const std::string& disk, const std::string& point) {
    const auto core = std::string(512, 'd') + std::string(512, 'h') + "(,gpt2)/boot/grub of " + disk;
    std::string start(512, '\0');
    if (disk == "sda") start.replace(0x5C, 1, "\3").replace(510, 2, "\x55\xaa");
    write("/dev/" + disk, start + std::string(1024, '\0') + (disk == "sda" ? core : "") + std::string(512, '\0'));
    write((point == "/" ? "" : point) + "/boot/grub/i386-pc/core.img", core);
  }

  bool _isUefi;
  std::map<std::string, std::string> _facts;
};

}  // namespace tavisk
