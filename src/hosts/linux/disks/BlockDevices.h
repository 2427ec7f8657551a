// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/DiskDescription.h"

namespace tavisk {

/// A disk, a partition or a mapped volume, as sysfs tells of it.
struct BlockDevice {
  DiskName name;  ///< the kernel's: "sda2", "nvme0n1p1", "dm-0"
  DeviceNumber number;
  std::string path;         ///< in the device tree; its files are in "/sys" + path
  std::string node;         ///< "/dev/sda2"
  DiskName disk;            ///< the one whose partition it is; of another device itself
  int partition = 0;        ///< its number; 0: not a partition
  std::uint64_t start = 0;  ///< of a partition, in units of 512 bytes
  std::uint64_t size = 0;   ///< in units of 512 bytes; 0: no medium
  bool writable = true;
};

/// By what the device mapper knows a mapped volume.
struct Mapping {
  std::string name;  ///< its node is "/dev/mapper/NAME"
  std::string uuid;  ///< begins with what has made it: "LVM-", "CRYPT-"
};

/// What a connection to a disk is called: what protocolOf() of DiskQueries answers.
namespace transport {
inline constexpr const char* usb = "USB";
inline constexpr const char* diskImage = "Disk Image";
inline constexpr const char* iscsi = "iSCSI";
inline constexpr const char* network = "Network";
}  // namespace transport

/// The block devices of the machine, read from sysfs at each question. A device that goes away meanwhile is not there,
/// and no failure; what else keeps something from being looked at is one. From any thread.
class BlockDevices {
 public:
  /// The root is not owned.
  explicit BlockDevices(const SystemRoot& root) : _root(root) {}

  /// The names of all, sorted by bytes.
  Result<std::vector<DiskName>> list() const;
  Result<std::optional<BlockDevice>> find(const DiskName& name) const;
  Result<std::optional<BlockDevice>> withNumber(DeviceNumber number) const;
  /// The device that a node is of: "/dev/sda2", or a link to one.
  Result<std::optional<BlockDevice>> withNode(const std::string& node) const;

  /// The hardware at the bottom: the disk of a partition; of a mapped volume or an array the first of the disks that
  /// it is on. A name that is not known is its own.
  Result<DiskName> wholeDisk(const DiskName& name) const;

  /// Absent when it is no mapped volume.
  Result<std::optional<Mapping>> mappingOf(const BlockDevice& device) const;
  /// Whether mapped volumes or arrays are on it, which then have what it holds.
  Result<bool> isCarrying(const BlockDevice& device) const;

  /// Of a whole disk, in bytes; 512 when it is not known.
  Result<unsigned> logicalBlockSize(const DiskName& disk) const;
  /// Whether reading a device comes back soon: a suspended mapping does not, and an empty floppy drive takes seconds.
  Result<bool> answersReads(const BlockDevice& device) const;
  /// Whether a whole disk gives its medium away.
  Result<bool> isRemovable(const DiskName& disk) const;
  /// Whether a whole disk is a drive for optical discs.
  Result<bool> isOptical(const DiskName& disk) const;
  /// How a whole disk is connected: one of `transport`, or "SATA", "NVMe" ...; empty when that is not known.
  Result<std::string> transportOf(const DiskName& disk) const;
  /// Whether a whole disk stays in the machine, as far as the machine knows.
  Result<bool> isInternal(const DiskName& disk) const;

 private:
  const SystemRoot& _root;
};

}  // namespace tavisk
