// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

#include "platform/Text.h"

namespace tavisk {

/// Whether XML 1.0 can hold the code point (its production 2, "Char").
constexpr bool isXmlCharacter(char32_t codePoint) {
  if (codePoint < 0x20) return codePoint == '\t' || codePoint == '\n' || codePoint == '\r';
  return codePoint < 0xD800 || (codePoint >= 0xE000 && codePoint < 0xFFFE) ||
         (codePoint >= 0x10000 && codePoint <= 0x10FFFF);
}

/// Where the first byte stands that is not UTF-8 or begins a character that XML cannot hold.
inline std::optional<std::size_t> offsetOfNonXml(std::string_view text) {
  std::string_view rest = text;
  while (!rest.empty()) {
    const std::size_t offset = text.size() - rest.size();
    const std::optional<char32_t> codePoint = takeCodePoint(rest);
    if (!codePoint || !isXmlCharacter(*codePoint)) return offset;
  }
  return std::nullopt;
}

}  // namespace tavisk
