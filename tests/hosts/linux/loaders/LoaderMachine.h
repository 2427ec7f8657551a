// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <filesystem>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "TemporaryFolder.h"
#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/loaders/Loaders.h"

namespace tavisk {

/// Contents by place: "sda2:/boot/vmlinuz".
using LoaderFiles = std::map<std::string, std::string>;

/// Two disks with several systems each, and a third one with two volumes of one name.
class LoaderMachine {
 public:
  explicit LoaderMachine(const LoaderFiles& files) {
    for (const auto& volume : volumes.all()) std::filesystem::create_directories(at(volume.device.name.text + ":/"));
    for (const auto* kernel : {"sda2:/boot/vmlinuz", "sda3:/boot/vmlinuz", "sda5:/vmlinuz", "sdb2:/boot/vmlinuz",
                               "sdb3:/@/boot/vmlinuz", "sda1:/vmlinuz", "sda4:/vmlinuz", "sdc1:/boot/vmlinuz"})
      write(kernel, "a kernel");
    for (const auto& [place, contents] : files) write(place, contents);
  }

  void write(const std::string& place, const std::string& contents) const {
    _folder.write(at(place).lexically_relative(_folder.path()), contents);
  }
  std::filesystem::path at(const std::string& place) const {
    const auto sign = place.find(':');
    return _folder.path() / place.substr(0, sign) / std::filesystem::path(place.substr(sign + 1)).relative_path();
  }
  /// Of a program for UEFI, else of the folder of a menu.
  Result<LoaderReading> read(const std::string& place, const std::string& options = "",
                             const LoaderVariables& variables = {}) const {
    const auto sign = place.find(':');
    const auto path = place.substr(sign + 1);
    const auto& volume = *std::ranges::find(volumes.all(), place.substr(0, sign),
                                            [](const auto& each) { return each.device.name.text; });
    if (path.starts_with('/')) return readGrubFolder(volumes, volume, path);
    return readLoader(volumes, volume, path, options, variables);
  }

 private:
  static Volume volume(const std::string& name, const std::string& type, const std::string& uuid,
                       const std::string& partitionType = "0fc63daf-8483-4772-8e79-3d69d8477de4") {
    Volume made;
    made.device.name = {name};
    made.disk = {name.substr(0, 3)};
    made.facts = {type, "filesystem", "L-" + uuid, uuid, {}};
    if (name.starts_with("dm")) {
      made.mappedNodes = {"/dev/mapper/vg-root", "/dev/vg/root", "/dev/disk/by-id/dm-uuid-LVM-aB12"};
    } else {
      made.partition = PartitionFacts{name.back() - '0', 0, 0, "part-" + name, partitionType, ""};
    }
    return made;
  }

  TemporaryFolder _folder;

 public:
  const Volumes volumes{
      {volume("sda1", "vfat", "AAAA-0001", efiSystemPartitionGuid), volume("sda2", "ext4", "aaaa"),
       volume("sda3", "ext4", "bbbb"), volume("sda4", "vfat", "AAAA-0004", "bc13c2ff-59e6-4262-a352-b275fd6f7172"),
       volume("sda5", "ext4", "b007"), volume("sdb1", "vfat", "BBBB-0001", efiSystemPartitionGuid),
       volume("sdb2", "ext4", "cccc"), volume("sdb3", "btrfs", "dddd"), volume("sdc1", "ext4", "eeee"),
       volume("sdc2", "ext4", "eeee"), volume("dm-0", "xfs", "ffff")},
      [this](const Volume& volume) -> Result<SystemRoot> { return SystemRoot(at(volume.device.name.text + ":/")); }};
};

/// A program for UEFI with these sections.
inline std::string efiProgram(const std::vector<std::pair<std::string, std::string>>& sections) {
  std::string headers = "MZ" + std::string(58, '\0');
  appendNumber(headers, 64, 4);
  headers += std::string("PE\0\0\x64\x86", 6);
  appendNumber(headers, sections.size(), 2);
  headers += std::string(12, '\0');
  appendNumber(headers, 240, 2);
  headers += std::string(2, '\0');
  std::string optional(240, '\0');
  optional.replace(0, 2, "\x0b\x02");
  optional[68] = 10;  // a program for UEFI
  headers += optional;
  std::string data;
  for (const auto& [name, contents] : sections) {
    auto padded = name;
    padded.resize(8);
    headers += padded;
    for (const auto number : {contents.size(), std::size_t(0), contents.size(), 1024 + data.size()})
      appendNumber(headers, number, 4);
    headers += std::string(16, '\0');
    data += contents;
  }
  headers.resize(1024);
  return headers + data;
}

inline std::string shimProgram(const std::string& next = "\\grubx64.efi", const std::string& section = ".data") {
  return efiProgram({{section, "xx" + toUtf16(next) + "yy"}, {".sbat", "sbat,1,SBAT\nshim,4,UEFI shim,shim,1\n"}});
}

inline std::string grubProgram(const std::string& prefix, const std::string& configuration = "",
                               const std::string& components = "grub,5,FSF,grub,2.06\n") {
  std::string objects;
  const auto add = [&](unsigned type, const std::string& text) {
    appendNumber(objects, type, 4);
    appendNumber(objects, text.size() + 9, 4);
    objects += text + std::string(1, '\0');
  };
  add(0, "a module");
  if (!configuration.empty()) add(2, configuration);
  add(3, prefix);
  std::string info = "mimg" + std::string(4, '\0');
  appendNumber(info, 24, 8);
  appendNumber(info, 24 + objects.size(), 8);
  return efiProgram({{"mods", info + objects}, {".sbat", components}});
}

inline std::string debianGrub() {
  return grubProgram("/EFI/debian", "normal (memdisk)/grub.cfg\n", "grub,5,FSF,grub\ngrub.debian,5,Debian,grub2\n");
}

inline std::string systemdBootProgram() {
  return efiProgram({{".sdmagic", "#### LoaderInfo: systemd-boot 252 ####"}, {".osrel", "ID=systemd-boot\n"}});
}

inline std::string unifiedImage(const std::string& commandLine, const std::string& osRelease = "ID=arch\n") {
  return efiProgram({{".osrel", osRelease}, {".cmdline", commandLine}, {".linux", "a kernel"}});
}

}  // namespace tavisk
