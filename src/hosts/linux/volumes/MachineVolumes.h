// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

/// What of the machine's volumes may hold a system or a loader: file systems on internal disks, mounted or not, and
/// those of other disks (removable, USB, network, image) that somebody has mounted. What cannot be looked at is left
/// out and told in `unseen`, a locked encrypted volume too.
struct MachineVolumes {
  std::vector<Volume> volumes;  ///< by name
  std::vector<Failure> unseen;
  std::vector<OtherDevice>
      others;  ///< the names of all other devices but those that something else has the contents of
};

/// Fails when not even the list of devices can be read.
Result<MachineVolumes> machineVolumes(LinuxDisks& disks, const MountTable& mounts);

}  // namespace tavisk
