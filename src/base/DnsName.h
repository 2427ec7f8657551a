// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

namespace tavisk {

/// Whether a machine may have this name in the DNS (RFC 1123, 2.1): labels of 1 to 63 letters, digits and hyphens, none
/// with a hyphen at its ends, joined by dots; at most 253 characters in all.
bool isDnsName(std::string_view name);

/// Whether a text is the name of a host that may be asked (as isDnsName, also with underscores and a dot at its end) or
/// a numeric IPv4 or IPv6 address, and so cannot be anything else in a configuration file.
bool isHostNameOrAddress(const std::string& text);

/// "mail" of "mail.example".
std::string firstLabel(const std::string& name);

}  // namespace tavisk
