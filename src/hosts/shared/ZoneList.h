// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Where a machine keeps its compiled time zones: this folder and the name of the zone.
inline constexpr const char* zoneFolder = "/usr/share/zoneinfo/";

/// The names of the zones and of their links that a machine has installed, sorted by bytes: those of tzdata.zi (zic(8)
/// source), without it those of zone1970.tab and "UTC", without that the compiled files themselves (tzfile(5)).
Result<std::vector<std::string>> installedZones(const SystemRoot& root);

}  // namespace tavisk
