// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The network interface with a hardware address, "52:54:00:12:34:56"; fails when there is none.
Result<std::string> interfaceWith(const std::string& hardwareAddress, const SystemRoot& root);

}  // namespace tavisk
