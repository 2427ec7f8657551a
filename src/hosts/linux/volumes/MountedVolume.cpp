// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/MountedVolume.h"

namespace tavisk {

Result<bool> isMountOf(const Mount& mount, const BlockDevices& devices, const BlockDevice& device) {
  if (mount.device.major != 0) return mount.device == device.number;
  const auto source = devices.withNode(mount.source);
  if (!source) return source.failure();
  return *source && (*source)->number == device.number;
}

Result<const Mount*> mountOf(const MountTable& mounts, const BlockDevices& devices, const BlockDevice& device,
                             const std::string& type) {
  const auto* best = mounts.mountOf(device.number);
  if (best) return best;
  for (const auto& mount : mounts.mounts()) {
    const bool isBetter = !best || (best->root != "/" && mount.root == "/");
    if (!mount.visible || mount.device.major != 0 || mount.type != type || !isBetter) continue;
    const auto isIts = isMountOf(mount, devices, device);
    if (!isIts) return isIts.failure();
    if (*isIts) best = &mount;
  }
  return best;
}

}  // namespace tavisk
