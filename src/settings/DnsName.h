// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace tavisk {

/// Whether a machine may have this name in the DNS (RFC 1123, 2.1): labels of 1 to 63 letters, digits and hyphens, none
/// with a hyphen at its ends, joined by dots; at most 253 characters in all.
bool isDnsName(std::string_view name);

}  // namespace tavisk
