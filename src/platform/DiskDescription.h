// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace tavisk {

/// The name of a disk or volume on this machine: "disk0s2", "sda2".
struct DiskName {
  std::string text;

  bool operator==(const DiskName&) const = default;
};

/// What the host knows of a disk. An absent text is not known or does not apply.
struct DiskDescription {
  std::optional<std::string> mediaName;   ///< the disk's name, as in DiskName
  std::optional<std::string> volumeName;  ///< the volume's own name, its label
  std::optional<std::string> volumePath;  ///< where the volume is mounted; absent: not mounted
  std::optional<std::string> volumeKind;  ///< the file-system type: "msdos", "ntfs", "cd9660", "udf"
  std::optional<std::string> volumeUuid;
  std::optional<std::string> mediaContent;  ///< what the partition is said to hold
  std::optional<std::string> devicePath;    ///< in the device tree
  std::optional<std::string> busPath;
  std::int64_t mediaSize = 0;  ///< bytes
  bool mediaWritable = true;
  bool volumeMountable = true;
  bool volumeNetwork = false;
};

/// The entries of a description whose changes can be watched.
enum class DiskKey { volumeName, mediaWritable, mediaContent, volumeUuid, busPath, volumePath, mediaSize };

/// The keys whose values differ, in the order of the enumeration.
std::vector<DiskKey> changedKeys(const DiskDescription& before, const DiskDescription& after);

/// Which disks a callback is told of; an absent member accepts either.
struct DiskMatch {
  std::optional<bool> volumeMountable;
  std::optional<bool> volumeNetwork;

  bool accepts(const DiskDescription& disk) const;
};

}  // namespace tavisk
