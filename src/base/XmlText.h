// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstddef>
#include <optional>
#include <string_view>

#include "base/Text.h"

namespace tavisk {

/// Whether XML 1.0 can hold the code point (its production 2, "Char").
constexpr bool isXmlCharacter(char32_t codePoint) {
  if (codePoint < 0x20) return codePoint == '\t' || codePoint == '\n' || codePoint == '\r';
  return codePoint < 0xD800 || (codePoint >= 0xE000 && codePoint < 0xFFFE) ||
         (codePoint >= 0x10000 && codePoint <= 0x10FFFF);
}

/// What most of a text is: printable ASCII and line ends.
constexpr bool isPlainText(char byte) {
  return (byte >= ' ' && byte <= '~') || byte == '\n' || byte == '\t';
}

/// Where the first byte stands that is not UTF-8 or begins a character that XML cannot hold.
inline std::optional<std::size_t> offsetOfNonXml(std::string_view text) {
  std::string_view rest = text;
  while (true) {
    rest.remove_prefix(static_cast<std::size_t>(std::ranges::find_if_not(rest, isPlainText) - rest.begin()));
    if (rest.empty()) return std::nullopt;
    const auto offset = text.size() - rest.size();
    const auto codePoint = takeCodePoint(rest);
    if (!codePoint || !isXmlCharacter(*codePoint)) return offset;
  }
}

}  // namespace tavisk
