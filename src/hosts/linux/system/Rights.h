// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"

namespace tavisk {

/// What an administrator who is not root reads where only root may change something; absent for root.
std::optional<Failure> whyNeedsRoot(const std::string& tried, const std::string& on);

}  // namespace tavisk
