// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>

#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/BlockProbe.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What the device manager has found out about one device and keeps in /run/udev: its properties, by the names that
/// `udevadm info` shows. Nothing where no device manager runs.
class DeviceProperties {
 public:
  static DeviceProperties ofBlockDevice(const SystemRoot& root, DeviceNumber number);

  bool empty() const { return _values.empty(); }
  std::optional<std::string> find(const std::string& name) const;
  /// Of a property whose blanks and special characters are written as \x20.
  std::optional<std::string> findEncoded(const std::string& name) const;
  bool isSet(const std::string& name) const { return find(name) == "1"; }
  /// Whether one of those whose names begin so is.
  bool isAnySet(const std::string& beginning) const;

 private:
  std::map<std::string, std::string> _values;
};

enum class OpticalMedium { none, cd, dvd, other };

/// What is in the drive: from the device manager, else from the drive itself. A drive that does not tell has `other`.
OpticalMedium mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties);

/// All that is known of a block device that has a medium, whether mounted or not.
struct DiskFacts {
  BlockDevice device;
  VolumeFacts volume;
  PartitionTable table;                      ///< of a whole disk
  std::optional<std::string> partitionType;  ///< when the device manager knows it; else it stands in the disk's table
  std::string busPath;
  OpticalMedium medium = OpticalMedium::none;
  std::optional<Failure> unread;  ///< why the volume and the table are not known
};

/// Asks the device manager's database, or reads the disk where that says nothing. Absent when there is no such device
/// or nothing in it.
std::optional<DiskFacts> factsOf(const SystemRoot& root, const DiskName& name);

}  // namespace tavisk
