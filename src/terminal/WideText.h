// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace tavisk {

/// One wide character a code point. A byte that is not UTF-8 becomes a lone surrogate (U+DC00 and the byte), and that
/// byte again on the way back: no text is lost.
std::wstring wideText(std::string_view bytes);
std::string bytesOf(std::wstring_view text);

/// Typed bytes that become characters as they come.
class TypedText {
 public:
  void add(char byte) { _bytes += byte; }
  /// The next character; absent while it is not complete.
  std::optional<wchar_t> take();
  /// As take; what will never be complete comes byte by byte.
  std::optional<wchar_t> takeRest();

 private:
  wchar_t takeByte();

  std::string _bytes;
};

}  // namespace tavisk
