// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// Whether a text is a host name (RFC 1123 letters, digits and hyphens, also an underscore; at most 253 bytes) or a
/// numeric IPv4 or IPv6 address, and so cannot be anything else in a configuration file.
bool isHostNameOrAddress(const std::string& text);

}  // namespace tavisk
