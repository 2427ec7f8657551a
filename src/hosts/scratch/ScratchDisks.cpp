// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchDisks.h"

#include <utility>

namespace tavisk {
namespace {

/// "disk0" of "disk0s2", "disk0" of itself.
std::string withoutPartition(const std::string& name) {
  const auto last = name.find_last_not_of("0123456789");
  const bool isPartition = last != std::string::npos && last + 1 != name.size() && name[last] == 's';
  return isPartition ? name.substr(0, last) : name;
}

void describe(ScratchDisk& disk, const std::string& name, const MachineSection& values) {
  disk.mediaName = name;
  disk.volumeName = values.optionalText("Volume Name");
  disk.volumePath = values.optionalText("Mount Point");
  disk.volumeKind = values.optionalText("Kind");
  disk.volumeUuid = values.optionalText("UUID");
  disk.mediaContent = values.optionalText("Content");
  disk.devicePath = values.optionalText("Device Path");
  disk.busPath = values.optionalText("Bus Path");
  disk.mediaSize = values.integer("Size");
  disk.mediaWritable = values.boolean("Writable");
  disk.volumeMountable = values.boolean("Mountable");
  disk.volumeNetwork = values.boolean("Network");
}

std::shared_ptr<const ScratchDisk> diskFrom(const std::string& name, const MachineSection& values) {
  auto disk = std::make_shared<ScratchDisk>();
  describe(*disk, name, values);
  disk->wholeDisk = {values.optionalText("Whole Disk").value_or(withoutPartition(name))};
  disk->protocol = values.text("Protocol");
  disk->scheme = static_cast<int>(values.integer("Scheme"));
  disk->internal = values.boolean("Internal");
  disk->cd = values.boolean("CD");
  disk->dvd = values.boolean("DVD");
  disk->optical = values.boolean("Optical");
  disk->opticalBootable = values.boolean("Optical Bootable");
  disk->opticalStatus = static_cast<int>(values.integer("Optical Status"));
  return disk;
}

ScratchDisks::Snapshot snapshotOf(const MachineSection& disks) {
  auto snapshot = std::make_shared<DiskSnapshot>();
  for (const auto& name : disks.keys()) snapshot->add(diskFrom(name, disks.section(name)));
  return snapshot;
}

}  // namespace

std::shared_ptr<const ScratchDisk> ScratchDisks::find(const DiskName& name) {
  auto disk = current()->find(name);
  if (!disk) {
    const std::scoped_lock lock(_mutex);
    disk = _old ? _old->find(name) : nullptr;
  }
  return std::static_pointer_cast<const ScratchDisk>(disk);
}

ScratchDisks::Snapshot ScratchDisks::current() {
  const std::scoped_lock lock(_mutex);
  if (!_current) _current = snapshotOf(_machine.section("Disks"));
  return _current;
}

ScratchDisks::Snapshot ScratchDisks::renew(const MachineFile::Contents& machine) {
  auto snapshot = snapshotOf(MachineSection("", machine).section("Disks"));
  const std::scoped_lock lock(_mutex);
  _old = std::exchange(_current, snapshot);
  return snapshot;
}

void ScratchDisks::forgetOld() {
  const std::scoped_lock lock(_mutex);
  _old = nullptr;
}

}  // namespace tavisk
