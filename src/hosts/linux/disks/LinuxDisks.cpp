// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/LinuxDisks.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::int64_t sector = 512;
constexpr int deepestOverlay = 4;

bool isOneOf(const std::string& type, std::initializer_list<const char*> types) {
  return std::ranges::find(types, type) != types.end();
}

bool isNetworkType(const std::string& type) {
  return isOneOf(type, {"nfs", "nfs4", "cifs", "smb3", "ceph", "9p", "afs", "lustre", "fuse.sshfs", "fuse.glusterfs"});
}

/// File systems that are on block devices and have a number of their own.
bool isNumberedApart(const std::string& type) {
  return isOneOf(type, {"btrfs", "bcachefs"});
}

/// The name of a file-system type that the callers know, of Linux's name for it.
std::string kindOf(const std::string& type) {
  if (type == "vfat") return "msdos";
  if (type == "iso9660") return "cd9660";
  return type == "ntfs3" ? "ntfs" : type;
}

std::shared_ptr<DiskDescription> networkVolume(const Mount& mount) {
  auto disk = std::make_shared<DiskDescription>();
  disk->mediaName = mount.source;
  disk->volumePath = mount.point;
  disk->volumeKind = mount.type;
  disk->mediaWritable = !mount.readOnly;
  disk->volumeNetwork = true;
  return disk;
}

/// The folder of an overlay that its own files are in: the one that is written, else the lowest.
std::string folderBeneath(const Mount& overlay) {
  std::string lowest;
  for (const auto& option : split(overlay.options, ",")) {
    if (option.starts_with("upperdir=")) return option.substr(option.find('=') + 1);
    if (option.starts_with("lowerdir=")) lowest = option.substr(std::max(option.find('='), option.rfind(':')) + 1);
  }
  return lowest;
}

/// Whether a disk is one that this system may not read, or has no node for; or one that would not answer.
bool isBeyondReach(const Failure& failure) {
  return !failure.code || isGone(failure) || failure.code == std::errc::permission_denied ||
         failure.code == std::errc::operation_not_permitted;
}

}  // namespace

DiskName LinuxDisks::wholeDisk(const DiskName& name) {
  const auto disk = _devices.wholeDisk(name);
  if (disk) return *disk;
  _looks.tell(disk.failure());
  return name;
}

std::shared_ptr<const DiskDescription> LinuxDisks::find(const DiskName& name) {
  const std::scoped_lock lock(_mutex);
  readOnce();
  auto disk = _current->find(name);
  return disk || !_old ? disk : _old->find(name);
}

std::optional<DiskFacts> LinuxDisks::facts(const DiskName& name) {
  const std::scoped_lock lock(_mutex);
  readOnce();
  const auto found = _facts.find(name.text);
  return found == _facts.end() ? std::nullopt : std::optional(found->second);
}

std::optional<DiskName> LinuxDisks::holding(const std::string& path) {
  const std::scoped_lock lock(_mutex);
  readOnce();
  const auto* mount = _mounts.holding(path);
  return mount ? diskOf(*mount, 0) : std::nullopt;
}

bool LinuxDisks::show(std::map<std::string, Shown> volumes) {
  const std::scoped_lock lock(_mutex);
  return std::exchange(_shown, std::move(volumes)) != _shown;
}

std::optional<DiskName> LinuxDisks::shownAt(const std::string& path) {
  const std::scoped_lock lock(_mutex);
  const auto isAbove = [&](const auto& shown) {
    return shown.second.point.size() > 1 && (path + "/").starts_with(shown.second.point + "/");
  };
  const auto found = std::ranges::find_if(_shown, isAbove);
  return found == _shown.end() ? std::nullopt : std::optional(DiskName{found->first});
}

bool LinuxDisks::hasShown(const DiskName& disk) {
  const auto whole = wholeDisk(disk);
  const std::scoped_lock lock(_mutex);
  return std::ranges::any_of(_shown, [&](const auto& shown) {
    const auto itsDisk = _devices.wholeDisk({shown.first});
    return itsDisk && *itsDisk == whole;
  });
}

LinuxDisks::Snapshot LinuxDisks::renew(const ChangedDevices& changed) {
  const std::scoped_lock lock(_mutex);
  readMounts();
  readDevices(changed);
  _old = std::exchange(_current, describe());
  return _current;
}

void LinuxDisks::forgetOld() {
  const std::scoped_lock lock(_mutex);
  _old = nullptr;
}

void LinuxDisks::readOnce() {
  if (_current) return;
  readMounts();
  readDevices({{}, true});
  _current = describe();
}

void LinuxDisks::readMounts() {
  auto mounts = MountTable::read(_machine.root);
  if (!mounts) return _looks.tell(mounts.failure());
  _mounts = std::move(mounts).value();
  _bySource.clear();
  std::map<std::string, std::optional<DiskName>> sources;
  for (const auto& mount : _mounts.mounts()) {
    if (!mount.visible || !isNumberedApart(mount.type)) continue;
    auto [entry, isNew] = sources.try_emplace(mount.source);
    if (isNew) entry->second = diskOfSource(mount.source);
    if (!entry->second) continue;
    auto& best = _bySource[entry->second->text];
    if (!best || (best->root != "/" && mount.root == "/")) best = &mount;
  }
  _sources = std::move(sources);
}

/// The one that was known last where it cannot be looked at.
std::optional<DiskName> LinuxDisks::diskOfSource(const std::string& source) {
  const auto device = _devices.withNode(source);
  if (device) return *device ? std::optional((*device)->name) : std::nullopt;
  _looks.tell(device.failure());
  const auto known = _sources.find(source);
  return known == _sources.end() ? std::nullopt : known->second;
}

void LinuxDisks::readDevices(const ChangedDevices& changed) {
  auto names = changed.names;
  if (changed.all || _isListUnread) {
    const auto all = _devices.list();
    _isListUnread = !all;
    for (const auto& [name, facts] : _facts) names.insert(name);
    for (const auto& name : _looks.orTold(all)) names.insert(name.text);
  }
  names.merge(std::exchange(_unread, {}));
  names.merge(newlyMounted());
  for (const auto& name : names) readDevice(name);
}

/// Devices that may have got their file system, or have come, without an event.
std::set<std::string> LinuxDisks::newlyMounted() {
  std::set<std::string> names;
  std::set<DeviceNumber> known;
  for (const auto& [name, facts] : _facts) {
    known.insert(facts.device.number);
    const auto before = _current ? _current->find({name}) : nullptr;
    const auto* mount = mountOf(facts.device);
    if (before && mount && before->volumePath != mount->point) names.insert(name);
  }
  for (const auto& mount : _mounts.mounts()) {
    if (!mount.visible || mount.device.major == 0 || !known.insert(mount.device).second) continue;
    if (const auto device = _looks.orTold(_devices.withNumber(mount.device))) names.insert(device->name.text);
  }
  return names;
}

void LinuxDisks::readDevice(const std::string& name) {
  const auto facts = factsOf(_machine.root, {name});
  if (const auto unread = whyUnread(facts)) {
    _looks.tell(*unread);
    _unread.insert(name);
    if (!facts || isKnown((*facts)->device)) return;
  }
  _facts.erase(name);
  if (*facts) _facts.emplace(name, **facts);
}

/// Why a device is to be looked at again.
std::optional<Failure> LinuxDisks::whyUnread(const Result<std::optional<DiskFacts>>& looked) const {
  if (!looked) return looked.failure();
  const auto& facts = *looked;
  return facts && !isOutOfReach(*facts) ? facts->unread : std::nullopt;
}

/// In a container the machine's disks cannot be read, and are none of its business.
bool LinuxDisks::isOutOfReach(const DiskFacts& facts) const {
  if (!facts.unread) return false;
  const auto* mount = mountOf(facts.device);
  return !(mount && mount->root == "/") && isBeyondReach(*facts.unread);
}

/// Whether what was read last is of the same device, with the same medium as far as that can be told.
bool LinuxDisks::isKnown(const BlockDevice& device) const {
  const auto known = _facts.find(device.name.text);
  return known != _facts.end() && !known->second.unread && known->second.device.number == device.number &&
         known->second.device.size == device.size;
}

LinuxDisks::Snapshot LinuxDisks::describe() const {
  auto snapshot = std::make_shared<DiskSnapshot>();
  for (const auto& [name, facts] : _facts) snapshot->add(describe(facts));
  for (const auto& mount : _mounts.mounts())
    if (mount.visible && isNetworkType(mount.type)) snapshot->add(networkVolume(mount));
  return snapshot;
}

const Mount* LinuxDisks::mountOf(const BlockDevice& device) const {
  if (const auto* mount = _mounts.mountOf(device.number)) return mount;
  const auto found = _bySource.find(device.name.text);
  return found == _bySource.end() ? nullptr : found->second;
}

std::shared_ptr<DiskDescription> LinuxDisks::describe(const DiskFacts& facts) const {
  auto disk = std::make_shared<DiskDescription>();
  const auto* mount = mountOf(facts.device);
  disk->mediaName = facts.device.name.text;
  disk->volumeName = facts.volume.label;
  disk->volumeUuid = facts.volume.uuid;
  disk->mediaContent = contentOf(facts);
  disk->devicePath = facts.device.path;
  disk->busPath = facts.busPath;
  disk->mediaSize = static_cast<std::int64_t>(facts.device.size) * sector;
  disk->mediaWritable = facts.device.writable && (!mount || !mount->readOnly);
  disk->volumeMountable = mount || facts.volume.usage == "filesystem";
  if (facts.volume.type) disk->volumeKind = kindOf(*facts.volume.type);
  if (mount) {
    disk->volumePath = mount->point;
    if (!disk->volumeKind) disk->volumeKind = kindOf(mount->type);
  }
  const auto shown = _shown.find(facts.device.name.text);
  if (shown == _shown.end()) return disk;
  const auto& [name, point] = shown->second;
  disk->volumeName = name;
  disk->volumePath = point.empty() ? std::nullopt : std::optional(point);
  return disk;
}

/// What a partition is said to hold; of a whole disk its partition table.
std::optional<std::string> LinuxDisks::contentOf(const DiskFacts& facts) const {
  if (facts.partitionType) return facts.partitionType;
  const auto disk = _facts.find(facts.device.disk.text);
  const auto* partition =
      facts.device.partition == 0 || disk == _facts.end() ? nullptr : disk->second.table.find(facts.device.partition);
  if (partition) return partition->type;
  return facts.table.type.empty() ? std::nullopt : std::optional(facts.table.type);
}

std::optional<DiskName> LinuxDisks::diskOf(const Mount& mount, int depth) {
  if (isNetworkType(mount.type)) return DiskName{mount.source};
  if (mount.type == "overlay") {
    const auto* beneath = depth < deepestOverlay ? _mounts.holding(folderBeneath(mount)) : nullptr;
    return !beneath || beneath == &mount ? std::nullopt : diskOf(*beneath, depth + 1);
  }
  const auto device =
      _looks.orTold(isNumberedApart(mount.type) ? _devices.withNode(mount.source) : _devices.withNumber(mount.device));
  return device ? std::optional(device->name) : std::nullopt;
}

}  // namespace tavisk
