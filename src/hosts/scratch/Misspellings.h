// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "base/PropertyList.h"

namespace tavisk {

/// The settings that a name under "Refusals" can be of, as effects/SettingNames.h has them. Of firmware variables it is
/// what comes before the name of one.
std::span<const std::string_view> refusableSettings();

/// The names in a machine file that have no effect and seem to be meant to: a key that is like one of the table's, and
/// a refusal of no setting. Each as `"Clock" "TimeZone" (is "Time Zone" meant?)`.
std::vector<std::string> misspeltNames(const PropertyList::Dictionary& machine);

}  // namespace tavisk
