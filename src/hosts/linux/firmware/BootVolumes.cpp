// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/BootVolumes.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* bootFile = "boot.efi";
constexpr std::string_view ownFolder = R"(\EFI\tavisk\)";
constexpr std::string_view ownFile = R"(\boot.efi)";
constexpr std::uint64_t unit = 512;  // of what the kernel and libblkid tell

bool isReadByFirmware(const std::string& type) {
  return type == "vfat" || type == "msdos";
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

/// Whether a failure tells what is on a partition; others leave that open.
bool isAnswer(const Failure& failure) {
  return !failure.code || isAbsent(failure);
}

}  // namespace

bool BootVolumes::isBootFile(const std::string& file) {
  constexpr std::string_view inSystemFolder = R"(\System\Library\CoreServices\boot.efi)";
  const auto start = file.size() - std::min(file.size(), inSystemFolder.size());
  return compareIgnoringCase(std::string_view(file).substr(start), inSystemFolder) == 0 || fileSystemOf(file);
}

Result<BootTarget> BootVolumes::targetOf(const DiskName& volume, const std::string& systemFolder) const {
  const auto device = deviceOf(volume);
  if (!device) return device.failure();
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
  if (!disk) return disk.failure();
  const auto kind = facts.type.value_or("such a volume");
  const auto file = fileFor(facts);
  if (!file) return Failure{"start", volume.name.text, "UEFI firmware does not read " + kind};
  const auto partitions = systemPartitionsOf(*disk);
  if (!partitions) return partitions.failure();
  auto why = disk->text + " has no EFI system partition for " + *file;
  std::error_code code;
  for (const auto& partition : *partitions) {
    auto target = onSystemPartition(partition, *file);
    if (target || !isAnswer(target.failure())) return target;
    why = describe(target.failure());
    code = target.failure().code;
  }
  return Failure{"start", volume.name.text, "UEFI firmware does not read " + kind + ", and " + why, code};
}

Result<BootTarget> BootVolumes::onSystemPartition(const DiskName& name, const std::string& file) const {
  const auto device = deviceOf(name);
  if (!device) return device.failure();
  const auto mounts = _disks.mountsNow();
  if (!mounts) return mounts.failure();
  const auto* mount = mounts->mountOf(device->number);
  if (!mount || mount->root != "/")
    return Failure{"look for " + file, "the EFI system partition " + name.text, "it is not mounted"};
  if (!isReadByFirmware(mount->type))
    return Failure{"look for " + file, "the EFI system partition " + name.text, "it holds " + mount->type};
  const auto path = _root.standardized(mount->point + withSlashes(file));
  const auto isThere = path ? _root.isThere(*path) : path.failure();
  if (!isThere) return retold(isThere.failure(), "look for " + file, name.text);
  if (!*isThere)
    return Failure{"look for " + file, name.text, "there is no such file",
                   std::make_error_code(std::errc::no_such_file_or_directory)};
  const auto partition = identityOf(*device);
  if (!partition) return partition.failure();
  return BootTarget{"", *path, *partition, file};
}

Result<EfiPartition> BootVolumes::identityOf(const BlockDevice& partition) const {
  if (partition.partition == 0)
    return Failure{"start", partition.name.text, "firmware has no name for a volume that is no partition"};
  const auto disk = deviceOf(partition.disk);
  if (!disk) return disk.failure();
  const auto table = _disks.tableNow(*disk);
  if (!table) return table.failure();
  const auto* facts = table->find(partition.partition);
  if (!facts) return Failure{"find", partition.name.text, "the partition table does not have it"};
  const auto blockSize = _devices.logicalBlockSize(disk->name);
  if (!blockSize) return blockSize.failure();
  const auto blockUnits = *blockSize / unit;
  const EfiPartition identity{facts->uuid, static_cast<std::uint32_t>(facts->number), facts->start / blockUnits,
                              facts->size / blockUnits};
  if (!partitionNode(identity)) return Failure{"start", partition.name.text, "its disk has no signature"};
  const auto twins = partitionsWith(identity.uuid);
  if (!twins) return twins.failure();
  if (twins->size() > 1)
    return Failure{"start", partition.name.text, "another partition has the same identity " + identity.uuid};
  return identity;
}

Result<std::vector<DiskName>> BootVolumes::systemPartitionsOf(const DiskName& disk) const {
  const auto device = deviceOf(disk);
  if (!device) return device.failure();
  const auto table = _disks.tableNow(*device);
  if (!table) return table.failure();
  std::vector<DiskName> found;
  for (const auto& facts : table->partitions) {
    if (facts.type != efiSystemPartitionGuid && facts.type != efiSystemPartitionByte) continue;
    const auto name = partitionOf(disk, facts.number);
    if (!name) return name.failure();
    if (*name) found.push_back(**name);
  }
  return found;
}

Result<BlockDevice> BootVolumes::deviceOf(const DiskName& name) const {
  const auto device = _devices.find(name);
  if (!device) return device.failure();
  if (!*device) return Failure{"find", name.text, "no such disk"};
  return **device;
}

Result<std::vector<BlockDevice>> BootVolumes::allDevices() const {
  const auto names = _devices.list();
  if (!names) return names.failure();
  std::vector<BlockDevice> all;
  for (const auto& name : *names) {
    const auto device = _devices.find(name);
    if (!device) return device.failure();
    if (*device) all.push_back(**device);
  }
  return all;
}

Result<bool> BootVolumes::mayHaveContents(const BlockDevice& device) const {
  return device.size == 0 ? false : _devices.answersReads(device);
}

Result<bool> BootVolumes::isOn(const DiskName& disk, const BlockDevice& device) const {
  const auto whole = _devices.wholeDisk(device.name);
  if (!whole) return whole.failure();
  return *whole == disk;
}

Result<bool> BootVolumes::isOnHardware(const BlockDevice& device) const {
  const auto whole = _devices.wholeDisk(device.name);
  if (!whole) return whole.failure();
  const auto connection = _devices.transportOf(*whole);
  if (!connection) return connection.failure();
  return *connection != transport::diskImage;
}

/// Disk images and mapped volumes are nothing that firmware sees.
Result<bool> BootVolumes::isSeenByFirmware(const BlockDevice& disk) const {
  const auto isWhole = isOn(disk.name, disk);
  return isWhole && *isWhole ? isOnHardware(disk) : isWhole;
}

Result<std::optional<DiskName>> BootVolumes::partitionOf(const DiskName& disk, int number) const {
  const auto devices = allDevices();
  if (!devices) return devices.failure();
  for (const auto& device : *devices)
    if (device.disk == disk && device.partition == number) return device.name;
  return std::nullopt;
}

Result<std::vector<DiskName>> BootVolumes::partitionsWith(const std::string& uuid) const {
  const auto devices = allDevices();
  if (!devices) return devices.failure();
  std::vector<DiskName> found;
  for (const auto& device : *devices) {
    const auto partitions = partitionsWith(uuid, device);
    if (!partitions) return partitions.failure();
    found.insert(found.end(), partitions->begin(), partitions->end());
  }
  return found;
}

/// A disk that cannot be read is told of and has none: firmware does not start from it either, and a broken disk must
/// not keep others from being chosen.
Result<std::vector<DiskName>> BootVolumes::partitionsWith(const std::string& uuid, const BlockDevice& disk) const {
  const auto isSeen = isSeenByFirmware(disk);
  const auto isReadable = isSeen && *isSeen ? mayHaveContents(disk) : isSeen;
  if (!isReadable) return isReadable.failure();
  std::vector<DiskName> found;
  if (!*isReadable) return found;
  const auto table = _disks.looks().orTold(orGone(_disks.tableNow(disk))).value_or(PartitionTable());
  for (const auto& facts : table.partitions) {
    const auto partition = facts.uuid == uuid ? partitionOf(disk.name, facts.number) : std::optional<DiskName>();
    if (!partition) return partition.failure();
    if (*partition) found.push_back(**partition);
  }
  return found;
}

/// The links of the device database need no rights and no reading of disks, but may lead to a copy on another disk.
Result<std::optional<DiskName>> BootVolumes::fileSystemWith(const std::string& uuid, const DiskName& disk) const {
  const auto linked = _devices.withNode("/dev/disk/by-uuid/" + uuid);
  if (!linked) return linked.failure();
  const auto isLinked = *linked ? isOn(disk, **linked) : false;
  if (!isLinked) return isLinked.failure();
  if (*isLinked) return (*linked)->name;
  const auto devices = allDevices();
  if (!devices) return devices.failure();
  for (const auto& device : *devices) {
    const auto isOnDisk = isOn(disk, device);
    const auto isReadable = isOnDisk && *isOnDisk ? mayHaveContents(device) : isOnDisk;
    if (!isReadable) return isReadable.failure();
    if (!*isReadable) continue;
    const auto volume = _disks.looks().orTold(orGone(_disks.volumeNow(device))).value_or(VolumeFacts());
    if (volume.usage == "filesystem" && compareIgnoringCase(volume.uuid.value_or(""), uuid) == 0) return device.name;
  }
  return std::nullopt;
}

Result<DiskName> BootVolumes::volumeOf(const EfiPartition& partition, const std::string& file) const {
  auto started = partitionWith(partition);
  const auto uuid = fileSystemOf(file);
  if (!started || !uuid) return started;
  const auto disk = _devices.wholeDisk(*started);
  if (!disk) return disk.failure();
  const auto volume = fileSystemWith(*uuid, *disk);
  if (!volume) return volume.failure();
  if (*volume) return **volume;
  return Failure{"find", file, "its volume is not on " + disk->text};
}

Result<DiskName> BootVolumes::partitionWith(const EfiPartition& partition) const {
  const auto linked = _devices.withNode("/dev/disk/by-partuuid/" + partition.uuid);
  if (!linked) return linked.failure();
  const auto isOnMedium = *linked ? isOnHardware(**linked) : false;
  if (!isOnMedium) return isOnMedium.failure();
  if (*isOnMedium) return (*linked)->name;
  const auto found = partitionsWith(partition.uuid);
  if (!found) return found.failure();
  if (found->empty())
    return Failure{"find", textOf({*partitionNode(partition)}), "no partition here has this identity"};
  return found->front();
}

}  // namespace tavisk
