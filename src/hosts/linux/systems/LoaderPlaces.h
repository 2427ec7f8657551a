// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

/// A program that firmware can load from a partition, or a folder of GRUB's on a machine without UEFI.
struct LoaderPlace {
  std::optional<BootEntry> entry;  ///< absent: no boot entry names it
  Volume volume;                   ///< the partition
  std::string file;                ///< as firmware names it, "\EFI\debian\shimx64.efi"; of GRUB's folder "/boot/grub"
};

/// "Boot0003 (debian), \EFI\debian\shimx64.efi on sda1"
std::string nameOf(const LoaderPlace& place);

/// What a boot entry loads; without a file it is the one that firmware takes by itself (UEFI 2.10, 3.5.1.1). Fails when
/// the entry names no partition of this machine.
Result<LoaderPlace> placeOf(const BootEntry& entry, const Volumes& volumes);

/// The program that firmware loads from a partition when nothing else is named.
std::string fallbackFile();

/// The loaders in the usual places of an EFI system partition.
Result<std::vector<LoaderPlace>> loadersOn(const Volume& systemPartition, const Volumes& volumes);

/// The folder of GRUB's configuration on a volume whose disk has the boot code that grub-install made for it; absent
/// when there is none. The disk is read by its node, below the prefix of the machine's root.
Result<std::optional<LoaderPlace>> grubFolderOn(const Volume& volume, const Volumes& volumes, const SystemRoot& root);

/// Whether a disk has boot code of any maker in its first sector. One that this system may not read, as in a container,
/// has none that counts.
Result<bool> hasBootCode(const DiskName& disk, const SystemRoot& root);

/// Whether an entry leaves the partition to firmware: its path is that of a disk, without a partition, a file, a
/// network or a program of the firmware's own (UEFI 2.10, section 10.3).
bool namesWholeDisk(const BootEntry& entry);

bool isSystemPartition(const Volume& volume);
/// Whether both are the same file of the same partition: firmware does not tell letters by their case.
bool areSame(const LoaderPlace& one, const LoaderPlace& other);

}  // namespace tavisk
