// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/MountTable.h"

namespace tavisk {

/// Whether it is a mount of the device, of a file system that has a number of its own by its source.
Result<bool> isMountOf(const Mount& mount, const BlockDevices& devices, const BlockDevice& device);

/// The mount by which a device is best reached, as MountTable; also of a file system of this type that has a number of
/// its own, by its source. Null when there is none.
Result<const Mount*> mountOf(const MountTable& mounts, const BlockDevices& devices, const BlockDevice& device,
                             const std::string& type);

}  // namespace tavisk
