// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/MachineVolumes.h"

#include <optional>
#include <string_view>
#include <utility>

#include "hosts/linux/volumes/MountedVolume.h"

namespace tavisk {
namespace {

/// The name of a logical volume, "/dev/VG/LV", in the name of its mapping: a dash in one of the two is doubled
/// (lvm(8), "VALID NAMES"). Absent when it is none.
std::optional<std::string> logicalVolumeNode(const std::string& name) {
  std::string node = "/dev/";
  int separators = 0;
  for (std::size_t i = 0; i < name.size(); ++i) {
    const bool isDash = name[i] == '-';
    const bool isDouble = isDash && i + 1 < name.size() && name[i + 1] == '-';
    if (isDouble) ++i;
    if (isDash && !isDouble) ++separators;
    node += isDash && !isDouble ? '/' : name[i];
  }
  return separators == 1 ? std::optional(node) : std::nullopt;
}

/// What a device is taken for.
struct Looked {
  Volume volume;  ///< what is known of it
  bool counts = false;
  std::optional<Failure> whyUnseen = {};
};

/// A look at one device. What has gone reads as nothing; the first read that fails makes it unseen.
class VolumeLook {
 public:
  VolumeLook(LinuxDisks& disks, const MountTable& mounts) : _disks(disks), _devices(disks.devices()), _mounts(mounts) {}

  /// Absent for what is gone, and for what something else has the contents of.
  std::optional<Looked> at(const DiskName& name) {
    auto looked = find(name);
    if (looked) looked->whyUnseen = _failure;
    return looked;
  }

 private:
  template <typename Value>
  Value seen(Result<Value> read) {
    if (read) return std::move(read).value();
    if (!_failure) _failure = read.failure();
    return Value();
  }
  std::optional<Looked> find(const DiskName& name);
  bool isCovered(const BlockDevice& device);
  bool mayBeMounted(const DiskFacts& facts);
  std::optional<PartitionFacts> partitionOf(const DiskFacts& facts);
  std::vector<std::string> mappedNodesOf(const BlockDevice& device);

  LinuxDisks& _disks;
  const BlockDevices& _devices;
  const MountTable& _mounts;
  std::optional<Failure> _failure;
};

std::optional<Looked> VolumeLook::find(const DiskName& name) {
  const auto facts = _disks.facts(name);
  if (!facts) return std::nullopt;
  const auto* mount = seen(mountOf(_mounts, _devices, facts->device, facts->volume.type.value_or("")));
  const auto disk = seen(_devices.wholeDisk(name));
  const bool isOwn = mount || seen(_devices.isInternal(disk));
  if (!mount && isCovered(facts->device)) return std::nullopt;
  // Of a disk that does not count nothing more is read than is known.
  auto partition = isOwn ? partitionOf(*facts) : facts->partition;
  Looked looked{{facts->device, disk, facts->volume, std::move(partition), mappedNodesOf(facts->device)}};
  looked.counts = mount || (isOwn && mayBeMounted(*facts));
  if (!facts->volume.type && mount) looked.volume.facts.type = mount->type;
  return looked;
}

/// Whether something else has what it holds: a logical volume that a snapshot was made of, a path to a disk.
bool VolumeLook::isCovered(const BlockDevice& device) {
  if (seen(_devices.isCarrying(device))) return true;
  const auto disk = device.partition == 0 ? std::nullopt : seen(_devices.find(device.disk));
  return disk && seen(_devices.isCarrying(*disk));
}

bool VolumeLook::mayBeMounted(const DiskFacts& facts) {
  if (facts.unread && !_failure) _failure = facts.unread;
  if (facts.volume.usage == "crypto" && !_failure)
    _failure = Failure{"read", facts.device.name.text, "it is encrypted and locked"};
  return !_failure && facts.volume.usage == "filesystem";
}

/// From the device manager, else from the disk's table.
std::optional<PartitionFacts> VolumeLook::partitionOf(const DiskFacts& facts) {
  const auto number = facts.device.partition;
  if (number == 0 || facts.partition) return facts.partition;
  const auto disk = _disks.facts(facts.device.disk);
  if (!disk) return std::nullopt;
  const auto table = disk->table.find(number) ? disk->table : seen(_disks.tableNow(disk->device));
  const auto* partition = table.find(number);
  return partition ? std::optional(*partition) : std::nullopt;
}

std::vector<std::string> VolumeLook::mappedNodesOf(const BlockDevice& device) {
  const auto mapping = seen(_devices.mappingOf(device));
  if (!mapping) return {};
  std::vector nodes = {"/dev/mapper/" + mapping->name, "/dev/disk/by-id/dm-name-" + mapping->name};
  if (!mapping->uuid.empty()) nodes.push_back("/dev/disk/by-id/dm-uuid-" + mapping->uuid);
  const bool isLogicalVolume = mapping->uuid.starts_with("LVM-");
  if (auto node = isLogicalVolume ? logicalVolumeNode(mapping->name) : std::nullopt) nodes.push_back(*std::move(node));
  return nodes;
}

}  // namespace

Result<MachineVolumes> machineVolumes(LinuxDisks& disks, const MountTable& mounts) {
  const auto names = disks.devices().list();
  if (!names) return names.failure();
  MachineVolumes found;
  for (const auto& name : *names) {
    auto looked = VolumeLook(disks, mounts).at(name);
    if (!looked) continue;
    const bool isUnseen = looked->whyUnseen.has_value();
    if (isUnseen) found.unseen.push_back(*std::move(looked->whyUnseen));
    if (looked->counts && !isUnseen)
      found.volumes.push_back(std::move(looked->volume));
    else
      found.others.push_back({std::move(looked->volume), isUnseen});
  }
  return found;
}

}  // namespace tavisk
