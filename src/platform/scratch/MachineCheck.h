// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "platform/PropertyList.h"

namespace tavisk {

/// The first value of a machine that is not of its key's type: the key, as `"Clock" "Time"`, and what was expected.
/// Keys that the table does not have may hold anything.
std::optional<std::string> whyWrong(const PropertyList::Dictionary& machine);

}  // namespace tavisk
