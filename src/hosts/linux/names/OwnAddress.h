// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"

namespace tavisk {

/// Whether an address, IPv4 or IPv6 in figures, is one of the machine that runs the tool: one of its network interfaces
/// has it (getifaddrs(3)), or it is a loopback address. Any other text is none.
Result<bool> isOwnAddress(const std::string& address);

}  // namespace tavisk
