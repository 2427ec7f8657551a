// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/WideText.h"

#include <algorithm>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr char32_t firstByte = 0xDC00;
constexpr char32_t lastByte = 0xDCFF;

bool mayBecomeCharacter(std::string_view bytes) {
  return bytes.size() < sequenceLength(bytes.front()) && std::ranges::all_of(bytes.substr(1), isContinuation);
}

}  // namespace

std::optional<wchar_t> TypedText::take() {
  if (_bytes.empty()) return std::nullopt;
  std::string_view rest = _bytes;
  if (const auto character = takeCodePoint(rest)) {
    _bytes.erase(0, _bytes.size() - rest.size());
    return static_cast<wchar_t>(*character);
  }
  if (mayBecomeCharacter(_bytes)) return std::nullopt;
  return takeByte();
}

std::optional<wchar_t> TypedText::takeRest() {
  if (const auto character = take()) return character;
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
    while (const auto character = typed.take()) text += *character;
  }
  while (const auto character = typed.takeRest()) text += *character;
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
