// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/TextEncoding.h"

#include <cstdint>
#include <vector>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr char32_t replacement = 0xFFFD;

bool isHighSurrogate(char32_t unit) {
  return unit >= 0xD800 && unit < 0xDC00;
}
bool isLowSurrogate(char32_t unit) {
  return unit >= 0xDC00 && unit < 0xE000;
}

std::vector<char32_t> units(std::string_view bytes, bool bigEndian) {
  std::vector<char32_t> units;
  for (std::size_t i = 0; i + 1 < bytes.size(); i += 2) {
    const auto first = static_cast<std::uint8_t>(bytes[i]);
    const auto second = static_cast<std::uint8_t>(bytes[i + 1]);
    units.push_back(bigEndian ? first * 256U + second : second * 256U + first);
  }
  return units;
}

std::string fromUtf16(std::string_view bytes, bool bigEndian) {
  std::string text;
  const auto all = units(bytes, bigEndian);
  for (std::size_t i = 0; i < all.size(); ++i) {
    char32_t character = all[i];
    if (isHighSurrogate(character) && i + 1 < all.size() && isLowSurrogate(all[i + 1])) {
      character = 0x10000 + ((character - 0xD800) << 10U) + (all[++i] - 0xDC00);
    } else if (isHighSurrogate(character) || isLowSurrogate(character)) {
      character = replacement;
    }
    appendUtf8(text, character);
  }
  return text;
}

}  // namespace

std::string decodedText(std::string_view bytes) {
  if (bytes.starts_with("\xEF\xBB\xBF")) return std::string(bytes.substr(3));
  if (bytes.starts_with("\xFE\xFF")) return fromUtf16(bytes.substr(2), true);
  if (bytes.starts_with("\xFF\xFE")) return fromUtf16(bytes.substr(2), false);
  return std::string(bytes);
}

}  // namespace tavisk
