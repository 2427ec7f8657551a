// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/Result.h"

namespace tavisk {

/// The failure of a system call, with the system's own words for `error` (an errno value).
Failure systemFailure(std::string tried, std::string on, int error);

}  // namespace tavisk
