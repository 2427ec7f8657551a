// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/BlockProbe.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What is in an optical drive; `other` also when the drive does not tell.
enum class OpticalMedium { none, cd, dvd, other };

/// All that is known of a block device that has a medium, whether mounted or not.
struct DiskFacts {
  BlockDevice device;
  VolumeFacts volume;
  PartitionTable table;                      ///< of a whole disk; the device manager knows its type alone
  std::optional<std::string> partitionType;  ///< when the device manager knows it; else it stands in the disk's table
  std::optional<PartitionFacts> partition;   ///< the same, of all that stands there
  std::string busPath;
  OpticalMedium medium = OpticalMedium::none;
  std::optional<Failure> unread;  ///< why the medium, the volume or the table is not known
};

/// A text of the device manager's, who writes blanks and special characters as \x20, as it was.
std::string withoutHexEscapes(std::string_view text);

/// Asks the device manager's database, or reads the disk where that says nothing. Absent when there is no such device
/// or nothing in it; a failure when that could not be found out.
Result<std::optional<DiskFacts>> factsOf(const SystemRoot& root, const DiskName& name);

}  // namespace tavisk
