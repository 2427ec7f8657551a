// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

/// What a system says of itself (os-release(5)). What it does not say is empty.
struct OsRelease {
  std::string name;     ///< "Debian GNU/Linux"; "Linux" when it says none
  std::string version;  ///< "12"
  std::string build;    ///< "20261101.1", else the release's code name
};

/// Of the system whose "/" a volume is, or its subvolume. isAbsent() when it has none, which is no system.
Result<OsRelease> osReleaseOf(const Volumes& volumes, const Volume& root, const std::string& subvolume);

}  // namespace tavisk
