// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

namespace grub {
struct Beginning;
}

/// A Linux system that a loader starts.
struct SystemStart {
  DiskName root;          ///< the volume that becomes "/"
  std::string subvolume;  ///< of btrfs, as "rootflags=subvol=" has it, without a slash in front: "@"; empty: as mounted
  std::string kernel;     ///< its path on that volume or on the system's separate /boot
  std::string choice;     ///< by which the loader's default names it; empty: no name can choose it

  bool isSameSystem(const SystemStart& other) const { return root == other.root && subvolume == other.subvolume; }
};

/// Where a loader keeps its default.
struct LoaderDefault {
  enum class Kind {
    none,              ///< it has none that could be set
    environmentBlock,  ///< GRUB's saved entry
    variable,          ///< LoaderEntryDefault
  };
  Kind kind = Kind::none;
  DiskName volume;   ///< of the environment block
  std::string path;  ///< of the environment block, from the top of its file system
};

/// What a loader starts, worked out from the files that it reads. A failure says why that cannot be told for certain.
struct LoaderReading {
  std::string loader;                       ///< for people: "GRUB", "systemd-boot", "unified image"
  std::string configuration;                ///< for people: "/boot/grub/grub.cfg on sda2"; empty: none
  Result<SystemStart> next = Failure{};     ///< at the next start
  std::optional<std::string> once;          ///< the entry for the next start alone; absent: none
  Result<SystemStart> lasting = Failure{};  ///< by its default, whatever is for once
  std::vector<SystemStart> starts;          ///< all that are proven, in the order of its menu
  LoaderDefault keeps;
  std::shared_ptr<const grub::Beginning> grub;  ///< null: it is another loader
};

/// What the variables of systemd-boot say (vendor 4a67b082-0a4c-41cf-b6c7-440b29bb8c4f; The Boot Loader Interface).
/// An absent or empty one is empty.
struct LoaderVariables {
  std::string entryDefault;         ///< LoaderEntryDefault
  std::string entryOneShot;         ///< LoaderEntryOneShot
  std::string entryPreferred = {};  ///< LoaderEntryPreferred, since version 258
};

/// Works out what a program starts that firmware loads from a partition. `file` is as firmware names it,
/// "\EFI\debian\shimx64.efi". Fails when it is no loader that is understood. A shim is followed to the loader that it
/// starts. `options` is what the boot entry hands to it.
Result<LoaderReading> readLoader(const Volumes& volumes, const Volume& partition, const std::string& file,
                                 const std::string& options, const LoaderVariables& variables);

/// The same of GRUB's menu on a machine without UEFI: `volume` holds the folder ("/boot/grub", "/grub") of grub.cfg.
Result<LoaderReading> readGrubFolder(const Volumes& volumes, const Volume& volume, const std::string& folder);

/// Whether the default that `reading` keeps starts the system after it is set to the choice of `start`: worked out
/// from the same files before anything is written. Null means yes.
std::optional<Failure> whyNotChosen(const Volumes& volumes, const LoaderReading& reading, const SystemStart& start);

}  // namespace tavisk
