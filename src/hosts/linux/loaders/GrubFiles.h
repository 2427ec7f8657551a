// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "hosts/linux/loaders/GrubInterpreter.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk::grub {

/// What GRUB would have as the name of a device, and here names a volume: "(volume:sda2)".
std::string deviceOf(const Volume& volume);

/// The files on the volumes of a machine, as GRUB names them. It reads 16 MiB and 1000 files in all, then it fails.
class VolumeFiles final : public Files {
 public:
  /// Not owned.
  explicit VolumeFiles(const Volumes& volumes) : _volumes(volumes) {}

  Result<std::string> read(const FilePlace& place) const override;
  Result<std::vector<std::string>> list(const FilePlace& folder) const override;
  Result<bool> isThere(const FilePlace& place) const override;
  Truth isFound(const std::string& device) const override;

  /// Where a place is. Fails when that cannot be told: GRUB's numbers of disks say nothing.
  Result<const Volume*> volumeOf(const FilePlace& place) const;

 private:
  Result<const Volume*> withName(const std::string& name) const;
  Result<const Volume*> withFile(const std::string& path) const;

  const Volumes& _volumes;
  mutable std::size_t _filesLeft = 1000;
  mutable std::size_t _bytesLeft = 16777216;
};

}  // namespace tavisk::grub
