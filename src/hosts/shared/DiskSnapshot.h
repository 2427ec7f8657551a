// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "platform/DiskDescription.h"
#include "platform/DiskEventSession.h"

namespace tavisk {

/// The disks of one moment, in the host's order.
class DiskSnapshot {
 public:
  using Disk = std::shared_ptr<const DiskDescription>;

  /// The disk must have its media name; of two with the same name the first counts.
  void add(Disk disk);

  const std::vector<Disk>& disks() const { return _disks; }
  /// Null when there is no such disk.
  Disk find(const DiskName& name) const;
  /// The disk whose mount point is the longest one that holds the path (by whole components); of several on one mount
  /// point the last, which is on top.
  std::optional<DiskName> holding(const std::string& path) const;

 private:
  std::vector<Disk> _disks;
  std::unordered_map<std::string, std::size_t> _places;
  std::unordered_map<std::string, std::size_t> _mounted;
};

/// What has to be told when one moment follows another: the disks that have gone, in the order of before, then those
/// that are new or changed, in the order of after. A change without a key is one of what a DiskMatch asks.
std::vector<DiskEvent> differences(const DiskSnapshot& before, const DiskSnapshot& after);

}  // namespace tavisk
