// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What a volume holds, in libblkid's words. An absent text was not found.
struct VolumeFacts {
  std::optional<std::string> type;   ///< "ext4", "vfat", "iso9660", "LVM2_member"
  std::optional<std::string> usage;  ///< "filesystem", "raid", "crypto", "other"
  std::optional<std::string> label;
  std::optional<std::string> uuid;          ///< as that type writes it: "1A2B-3C4D" on FAT
  std::optional<std::string> bootSystemId;  ///< of an optical disc: "EL TORITO SPECIFICATION"
};

struct PartitionFacts {
  int number = 0;
  std::uint64_t start = 0;  ///< in units of 512 bytes
  std::uint64_t size = 0;   ///< in units of 512 bytes
  std::string uuid;         ///< small letters; of an MBR partition "<signature>-<number>"
  std::string type;         ///< GPT: a GUID in small letters; MBR: "0xef"
  std::string name;
};

/// The partition table of a disk.
struct PartitionTable {
  std::string type;  ///< "gpt", "dos", "mac"; empty: none
  std::string uuid;  ///< of the disk: a GUID, or the eight digits of an MBR's signature
  std::vector<PartitionFacts> partitions;

  /// Null when the table has no such partition.
  const PartitionFacts* find(int number) const;
};

/// The type of the partition that firmware reads first, in GPT and in MBR tables.
inline constexpr const char* efiSystemPartitionGuid = "c12a7328-f81f-11d2-ba4b-00a0c93ec93b";
inline constexpr const char* efiSystemPartitionByte = "0xef";

/// Reads a device node or an image; a type that cannot be told for certain is absent. Fails when it cannot be read.
Result<VolumeFacts> probeVolume(const SystemRoot& root, const std::string& node);
Result<PartitionTable> probePartitionTable(const SystemRoot& root, const std::string& node);

}  // namespace tavisk
