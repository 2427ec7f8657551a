// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

namespace tavisk {

/// The text of a file as UTF-8, in the encoding that its byte order mark declares (UTF-8, UTF-16 of either order);
/// without a mark the bytes as they are. What cannot be decoded becomes U+FFFD.
std::string decodedText(std::string_view bytes);

}  // namespace tavisk
