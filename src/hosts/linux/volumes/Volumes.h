// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/BlockProbe.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A file system of this machine, by all the names that loaders and kernels have for it.
struct Volume {
  BlockDevice device;
  DiskName disk;  ///< the hardware at the bottom
  VolumeFacts facts;
  std::optional<PartitionFacts> partition;  ///< absent: it is not on a partition
  std::vector<std::string> mappedNodes;     ///< "/dev/mapper/vg-root" and "/dev/vg/root" of a mapped volume
};

/// A device that no file is read from, and that answers to names all the same.
struct OtherDevice {
  Volume names;
  bool isUnseen = false;  ///< what it holds could not be looked at; its names may be missing
};

/// The volumes of one moment and the files on them. What two volumes answer to is nobody's name: neither is guessed,
/// and other devices count for that.
class Volumes {
 public:
  /// The files of a volume, from the top of its file system, with nothing that is mounted upon them. From any thread.
  using Open = std::function<Result<SystemRoot>(const Volume& volume)>;

  Volumes(std::vector<Volume> all, Open open, std::vector<OtherDevice> others = {})
      : _all(std::move(all)), _open(std::move(open)), _others(std::move(others)) {}

  const std::vector<Volume>& all() const { return _all; }
  const std::vector<OtherDevice>& others() const { return _others; }
  /// By the name of its device; null when there is none. Pointers hold as long as this.
  const Volume* named(const DiskName& name) const;
  /// Fails, with the reason for people, when no volume or more than one has the name. Pointers hold as long as this.
  Result<const Volume*> withUuid(std::string_view uuid) const;
  Result<const Volume*> withLabel(std::string_view label) const;
  Result<const Volume*> withPartitionUuid(std::string_view uuid) const;
  /// By the text of a kernel's "root=": "UUID=", "PARTUUID=", "LABEL=", "PARTLABEL=" (also in quotes), the same below
  /// /dev/disk/, and mapped volumes. The names of disks, "/dev/sda2", change from start to start and name nothing.
  Result<const Volume*> ofRootArgument(std::string_view root) const;
  /// The partition of a disk that has this type; null when there is none, a failure when several are, or when one that
  /// could not be looked at may be.
  Result<const Volume*> onDisk(const DiskName& disk, std::string_view partitionType) const;

  /// As those of SystemRoot; an absent file is what isAbsent() tells.
  Result<std::string> read(const Volume& volume, const std::string& path, std::size_t limit) const;
  Result<std::vector<std::string>> list(const Volume& volume, const std::string& path) const;
  Result<bool> isThere(const Volume& volume, const std::string& path) const;
  /// A volume that cannot be opened is never absent: that is no word on its files.
  Result<SystemRoot> filesOf(const Volume& volume) const;

 private:
  std::vector<Volume> _all;
  Open _open;
  std::vector<OtherDevice> _others;
};

}  // namespace tavisk
