// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tavisk {

/// How firmware writes numbers, texts and identifiers (UEFI 2.10, 1.8.1 and appendix A): least byte first.

/// Takes a number of so many bytes, 8 at most, off the front; absent, and nothing taken, when there are fewer.
std::optional<std::uint64_t> takeNumber(std::string_view& bytes, std::size_t width);
void appendNumber(std::string& bytes, std::uint64_t number, std::size_t width);

/// UTF-8 to UTF-16 without a mark or an end, and back. What cannot be decoded becomes U+FFFD.
std::string toUtf16(std::string_view text);
std::string fromUtf16(std::string_view bytes);

/// The 16 bytes of "c12a7328-f81f-11d2-ba4b-00a0c93ec93b"; absent when the text is none such.
std::optional<std::string> guidBytes(std::string_view text);
/// The text of 16 bytes, in small letters.
std::string guidText(std::string_view bytes);

}  // namespace tavisk
