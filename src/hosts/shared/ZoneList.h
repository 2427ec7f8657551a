// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/ClockService.h"

namespace tavisk {

/// The names of the zones and of their links that a machine has installed, sorted by bytes: those of tzdata.zi (zic(8)
/// source), without it those of zone1970.tab and "UTC", without that the compiled files themselves (tzfile(5)).
/// Names that are not well-formed are no zones, and none at all is a failure (isAbsent()). What cannot be looked at is
/// a failure: no list is short of a zone.
Result<std::vector<ZoneName>> installedZones(const SystemRoot& root);

}  // namespace tavisk
