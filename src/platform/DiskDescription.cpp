// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/DiskDescription.h"

namespace tavisk {

std::vector<DiskKey> changedKeys(const DiskDescription& before, const DiskDescription& after) {
  std::vector<DiskKey> changed;
  const auto compare = [&](DiskKey key, auto member) {
    if (before.*member != after.*member) changed.push_back(key);
  };
  compare(DiskKey::volumeName, &DiskDescription::volumeName);
  compare(DiskKey::mediaWritable, &DiskDescription::mediaWritable);
  compare(DiskKey::mediaContent, &DiskDescription::mediaContent);
  compare(DiskKey::volumeUuid, &DiskDescription::volumeUuid);
  compare(DiskKey::busPath, &DiskDescription::busPath);
  compare(DiskKey::volumePath, &DiskDescription::volumePath);
  compare(DiskKey::mediaSize, &DiskDescription::mediaSize);
  return changed;
}

bool DiskMatch::accepts(const DiskDescription& disk) const {
  return volumeMountable.value_or(disk.volumeMountable) == disk.volumeMountable &&
         volumeNetwork.value_or(disk.volumeNetwork) == disk.volumeNetwork;
}

}  // namespace tavisk
