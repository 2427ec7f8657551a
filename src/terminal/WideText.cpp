// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/WideText.h"

#include <cstddef>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr char32_t firstByte = 0xDC00;
constexpr char32_t lastByte = 0xDCFF;

/// Of the character that this byte begins; 1 when it begins none.
std::size_t lengthAfter(char first) {
  const auto byte = static_cast<unsigned char>(first);
  if (byte >= 0xC2 && byte <= 0xDF) return 2;
  if (byte >= 0xE0 && byte <= 0xEF) return 3;
  return byte >= 0xF0 && byte <= 0xF4 ? 4 : 1;
}

bool areContinuations(std::string_view bytes) {
  for (const char byte : bytes) {
    if ((static_cast<unsigned char>(byte) & 0xC0U) != 0x80U) return false;
  }
  return true;
}

bool mayBecomeCharacter(std::string_view bytes) {
  return bytes.size() < lengthAfter(bytes.front()) && areContinuations(bytes.substr(1));
}

}  // namespace

std::optional<wchar_t> TypedText::take() {
  if (_bytes.empty()) return std::nullopt;
  std::string_view rest = _bytes;
  if (const std::optional<char32_t> character = takeCodePoint(rest)) {
    _bytes.erase(0, _bytes.size() - rest.size());
    return static_cast<wchar_t>(*character);
  }
  if (mayBecomeCharacter(_bytes)) return std::nullopt;
  return takeByte();
}

std::optional<wchar_t> TypedText::takeRest() {
  if (const std::optional<wchar_t> character = take()) return character;
  return _bytes.empty() ? std::nullopt : std::optional(takeByte());
}

wchar_t TypedText::takeByte() {
  const auto byte = static_cast<unsigned char>(_bytes.front());
  _bytes.erase(0, 1);
  return static_cast<wchar_t>(firstByte + byte);
}

std::wstring wideText(std::string_view bytes) {
  TypedText typed;
  std::wstring text;
  for (const char byte : bytes) {
    typed.add(byte);
    while (const std::optional<wchar_t> character = typed.take()) text += *character;
  }
  while (const std::optional<wchar_t> character = typed.takeRest()) text += *character;
  return text;
}

std::string bytesOf(std::wstring_view text) {
  std::string bytes;
  for (const wchar_t character : text) {
    const auto codePoint = static_cast<char32_t>(character);
    if (codePoint >= firstByte && codePoint <= lastByte) {
      bytes += static_cast<char>(codePoint - firstByte);
    } else {
      appendUtf8(bytes, codePoint);
    }
  }
  return bytes;
}

}  // namespace tavisk
