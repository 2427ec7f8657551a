// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/disks/LinuxDisks.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// Answers for a partition or a mapped volume are those of the hardware at its bottom.
class LinuxDiskQueries final : public DiskQueries {
 public:
  static constexpr int masterBootRecord = 3;  ///< what partitionScheme() answers for it

  explicit LinuxDiskQueries(LinuxDisks& disks) : _disks(disks) {}

  bool is(DiskTrait trait, const DiskName& disk) override;
  std::string protocolOf(const DiskName& disk) override;
  std::string nameOf(DiskProtocol protocol) override;
  int partitionScheme(const DiskName& disk) override;
  OpticalBootability opticalBootability(const DiskName& disk) override;

 private:
  bool isOptical(const DiskName& whole) const;

  LinuxDisks& _disks;
};

}  // namespace tavisk
