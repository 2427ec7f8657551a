// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/firmware/EfiDevicePath.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/DiskDescription.h"

namespace tavisk {

/// What firmware is to start for a volume.
struct BootTarget {
  std::string label;  ///< of the volume, for people
  std::string path;   ///< the boot file, as this system names it
  EfiPartition partition;
  std::string file;  ///< the boot file on that partition, as firmware names it: "\EFI\BOOT\BOOTX64.EFI"
};

/// Between this system's volumes and the partitions and files by which firmware knows them.
class BootVolumes {
 public:
  /// Nothing that is given is owned.
  BootVolumes(const SystemRoot& root, LinuxDisks& disks) : _root(root), _disks(disks), _devices(disks.devices()) {}

  /// The boot file of a system: on its own volume where firmware reads that, else the one that is kept for the volume
  /// on the EFI system partition of its disk, in "\EFI\tavisk\<UUID of the file system>". Fails when firmware would
  /// find nothing, or could find something else. Mounts and disks are read as they are now.
  Result<BootTarget> targetOf(const DiskName& volume, const std::string& systemFolder) const;

  /// Whether a file is a volume's own, and no loader: it is in a system folder, or is kept for a volume.
  static bool isBootFile(const std::string& file);

  /// The volume that is started by such a file of a partition.
  Result<DiskName> volumeOf(const EfiPartition& partition, const std::string& file) const;

  /// As firmware knows a partition; fails when it has no name, or not one alone.
  Result<EfiPartition> identityOf(const BlockDevice& partition) const;

 private:
  Result<BootTarget> onVolume(const BlockDevice& volume, const std::string& systemFolder) const;
  Result<BootTarget> besideVolume(const BlockDevice& volume, const VolumeFacts& facts) const;
  Result<BootTarget> onSystemPartition(const DiskName& name, const std::string& file) const;
  Result<std::vector<DiskName>> systemPartitionsOf(const DiskName& disk) const;
  Result<BlockDevice> deviceOf(const DiskName& name) const;
  Result<std::vector<BlockDevice>> allDevices() const;
  Result<bool> mayHaveContents(const BlockDevice& device) const;
  Result<bool> isOn(const DiskName& disk, const BlockDevice& device) const;
  Result<bool> isOnHardware(const BlockDevice& device) const;
  Result<bool> isSeenByFirmware(const BlockDevice& disk) const;
  Result<std::optional<DiskName>> partitionOf(const DiskName& disk, int number) const;
  Result<std::vector<DiskName>> partitionsWith(const std::string& uuid) const;
  Result<std::vector<DiskName>> partitionsWith(const std::string& uuid, const BlockDevice& disk) const;
  Result<DiskName> partitionWith(const EfiPartition& partition) const;
  Result<std::optional<DiskName>> fileSystemWith(const std::string& uuid, const DiskName& disk) const;

  const SystemRoot& _root;
  LinuxDisks& _disks;
  const BlockDevices& _devices;
};

}  // namespace tavisk
