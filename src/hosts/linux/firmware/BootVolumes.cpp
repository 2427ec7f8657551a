// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/BootVolumes.h"

#include <algorithm>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr const char* bootFile = "boot.efi";
constexpr std::string_view ownFolder = R"(\EFI\tavisk\)";
constexpr std::string_view ownFile = R"(\boot.efi)";
constexpr std::uint64_t unit = 512;  // of what the kernel and libblkid tell

bool isReadByFirmware(const std::string& type) {
  return type == "vfat" || type == "msdos";
}

std::string withSeparators(std::string path, char from, char to) {
  std::ranges::replace(path, from, to);
  return path;
}

/// Where the boot file of a file system is on an EFI system partition; absent when its UUID is no name for a folder.
std::optional<std::string> fileFor(const VolumeFacts& facts) {
  constexpr const char* letters = "0123456789abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ-";
  if (!facts.uuid || facts.uuid->empty() || facts.uuid->find_first_not_of(letters) != std::string::npos)
    return std::nullopt;
  return std::string(ownFolder).append(*facts.uuid).append(ownFile);
}

/// The UUID in such a file's name. Firmware and FAT do not tell letters by their case.
std::optional<std::string> fileSystemOf(const std::string& file) {
  if (file.size() <= ownFolder.size() + ownFile.size()) return std::nullopt;
  const auto uuidSize = file.size() - ownFolder.size() - ownFile.size();
  if (compareIgnoringCase(file.substr(0, ownFolder.size()), ownFolder) != 0) return std::nullopt;
  if (compareIgnoringCase(file.substr(ownFolder.size() + uuidSize), ownFile) != 0) return std::nullopt;
  return file.substr(ownFolder.size(), uuidSize);
}

Failure unknownDisk(const DiskName& name) {
  return Failure{"find", name.text, "no such disk"};
}

}  // namespace

Result<BootTarget> BootVolumes::targetOf(const DiskName& volume, const std::string& systemFolder) const {
  const auto device = _devices.find(volume);
  if (!device) return unknownDisk(volume);
  const auto facts = _disks.volumeNow(*device);
  if (!facts) return facts.failure();
  auto found =
      isReadByFirmware(facts->type.value_or("")) ? onVolume(*device, systemFolder) : besideVolume(*device, *facts);
  if (!found) return found;
  auto target = *found;
  target.label = facts->label.value_or(volume.text);
  return target;
}

Result<BootTarget> BootVolumes::onVolume(const BlockDevice& volume, const std::string& systemFolder) const {
  const auto path = _root.standardized(systemFolder + "/" + bootFile);
  if (!path) return path.failure();
  const auto mounts = _disks.mountsNow();
  if (!mounts) return mounts.failure();
  const auto* mount = mounts->holding(*path);
  if (!mount || mount->device != volume.number) return Failure{"start", *path, "it is not on " + volume.name.text};
  const auto partition = identityOf(volume);
  if (!partition) return partition.failure();
  const auto inside = mount->root + "/" + path->substr(mount->point.size());
  std::string file;
  for (const auto& name : split(inside, "/")) file += '\\' + name;
  return BootTarget{"", *path, *partition, file};
}

Result<BootTarget> BootVolumes::besideVolume(const BlockDevice& volume, const VolumeFacts& facts) const {
  const auto disk = _devices.wholeDisk(volume.name);
  const auto kind = facts.type.value_or("such a volume");
  const auto file = fileFor(facts);
  if (!file) return Failure{"start", volume.name.text, "UEFI firmware does not read " + kind};
  const auto partitions = systemPartitionsOf(disk);
  if (!partitions) return partitions.failure();
  auto why = disk.text + " has no EFI system partition for " + *file;
  std::error_code code;
  for (const auto& partition : *partitions) {
    auto target = onSystemPartition(partition, *file);
    if (target) return target;
    why = describe(target.failure());
    code = target.failure().code;
  }
  return Failure{"start", volume.name.text, "UEFI firmware does not read " + kind + ", and " + why, code};
}

Result<BootTarget> BootVolumes::onSystemPartition(const DiskName& name, const std::string& file) const {
  const auto device = _devices.find(name);
  if (!device) return unknownDisk(name);
  const auto mounts = _disks.mountsNow();
  if (!mounts) return mounts.failure();
  const auto* mount = mounts->mountOf(device->number);
  if (!mount || mount->root != "/")
    return Failure{"look for " + file, "the EFI system partition " + name.text, "it is not mounted"};
  if (!isReadByFirmware(mount->type))
    return Failure{"look for " + file, "the EFI system partition " + name.text, "it holds " + mount->type};
  const auto path = _root.standardized(mount->point + withSeparators(file, '\\', '/'));
  if (!path || !_root.exists(*path)) {
    const auto code = path ? std::make_error_code(std::errc::no_such_file_or_directory) : path.failure().code;
    return Failure{"look for " + file, name.text, "there is no such file", code};
  }
  const auto partition = identityOf(*device);
  if (!partition) return partition.failure();
  return BootTarget{"", *path, *partition, file};
}

Result<EfiPartition> BootVolumes::identityOf(const BlockDevice& partition) const {
  const auto disk = _devices.find(partition.disk);
  if (!disk || partition.partition == 0)
    return Failure{"start", partition.name.text, "firmware has no name for a volume that is no partition"};
  const auto table = _disks.tableNow(*disk);
  if (!table) return table.failure();
  const auto* facts = table->find(partition.partition);
  if (!facts) return Failure{"find", partition.name.text, "the partition table does not have it"};
  const auto blockUnits = _devices.logicalBlockSize(disk->name) / unit;
  const EfiPartition identity{facts->uuid, static_cast<std::uint32_t>(facts->number), facts->start / blockUnits,
                              facts->size / blockUnits};
  if (!partitionNode(identity)) return Failure{"start", partition.name.text, "its disk has no signature"};
  if (partitionsWith(identity.uuid).size() > 1)
    return Failure{"start", partition.name.text, "another partition has the same identity " + identity.uuid};
  return identity;
}

Result<std::vector<DiskName>> BootVolumes::systemPartitionsOf(const DiskName& disk) const {
  const auto device = _devices.find(disk);
  if (!device) return unknownDisk(disk);
  const auto table = _disks.tableNow(*device);
  if (!table) return table.failure();
  std::vector<DiskName> found;
  for (const auto& facts : table->partitions) {
    if (facts.type != efiSystemPartitionGuid && facts.type != efiSystemPartitionByte) continue;
    if (auto name = partitionOf(disk, facts.number)) found.push_back(*name);
  }
  return found;
}

bool BootVolumes::isDiskImage(const DiskName& disk) const {
  return _devices.transportOf(disk) == transport::diskImage;
}

std::optional<DiskName> BootVolumes::partitionOf(const DiskName& disk, int number) const {
  for (const auto& name : _devices.list()) {
    const auto device = _devices.find(name);
    if (device && device->disk == disk && device->partition == number) return name;
  }
  return std::nullopt;
}

/// Disk images and mapped volumes are nothing that firmware sees.
std::vector<DiskName> BootVolumes::partitionsWith(const std::string& uuid) const {
  std::vector<DiskName> found;
  for (const auto& name : _devices.list()) {
    const auto disk = _devices.find(name);
    const bool isSeen = disk && disk->size > 0 && _devices.wholeDisk(name) == name && disk->disk == name;
    if (!isSeen || isDiskImage(name) || !_devices.answersReads(*disk)) continue;
    const auto table = _disks.tableNow(*disk);
    if (!table) continue;
    for (const auto& facts : table->partitions) {
      if (facts.uuid != uuid) continue;
      if (auto partition = partitionOf(name, facts.number)) found.push_back(*partition);
    }
  }
  return found;
}

/// The links of the device database need no rights and no reading of disks, but may lead to a copy on another disk.
std::optional<DiskName> BootVolumes::fileSystemWith(const std::string& uuid, const DiskName& disk) const {
  const auto linked = _devices.withNode("/dev/disk/by-uuid/" + uuid);
  if (linked && _devices.wholeDisk(linked->name) == disk) return linked->name;
  for (const auto& name : _devices.list()) {
    const auto device = _devices.wholeDisk(name) == disk ? _devices.find(name) : std::nullopt;
    if (!device || device->size == 0 || !_devices.answersReads(*device)) continue;
    const auto volume = _disks.volumeNow(*device);
    const bool isFileSystem = volume && volume->usage == "filesystem";
    if (isFileSystem && compareIgnoringCase(volume->uuid.value_or(""), uuid) == 0) return name;
  }
  return std::nullopt;
}

Result<DiskName> BootVolumes::volumeOf(const EfiPartition& partition, const std::string& file) const {
  auto started = partitionWith(partition);
  const auto uuid = fileSystemOf(file);
  if (!started || !uuid) return started;
  const auto disk = _devices.wholeDisk(*started);
  if (auto volume = fileSystemWith(*uuid, disk)) return *volume;
  return Failure{"find", file, "its volume is not on " + disk.text};
}

Result<DiskName> BootVolumes::partitionWith(const EfiPartition& partition) const {
  const auto linked = _devices.withNode("/dev/disk/by-partuuid/" + partition.uuid);
  if (linked && !isDiskImage(_devices.wholeDisk(linked->name))) return linked->name;
  const auto found = partitionsWith(partition.uuid);
  if (found.empty()) return Failure{"find", textOf({*partitionNode(partition)}), "no partition here has this identity"};
  return found.front();
}

}  // namespace tavisk
