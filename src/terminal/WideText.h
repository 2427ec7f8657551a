// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <clocale>
#include <optional>
#include <string>
#include <string_view>

namespace tavisk {

/// One wide character a code point. A byte that is not UTF-8 becomes a lone surrogate (U+DC00 and the byte), and that
/// byte again on the way back: no text is lost.
std::wstring wideText(std::string_view bytes);
std::string bytesOf(std::wstring_view text);

/// Typed bytes that become characters as they come.
class TypedText final {
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

/// UTF-8 as the character set of one thread, for a time. The locale of the process stays "C".
class Utf8Locale final {
 public:
  Utf8Locale() : _locale(::newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr)) {}
  ~Utf8Locale() {
    if (_locale) ::freelocale(_locale);
  }
  Utf8Locale(const Utf8Locale&) = delete;
  Utf8Locale& operator=(const Utf8Locale&) = delete;

  /// In force in this thread while it lives; without effect on a system that lacks the locale.
  class Scope {
   public:
    explicit Scope(const Utf8Locale& locale) : _before(::uselocale(locale._locale)) {}
    ~Scope() { ::uselocale(_before); }
    Scope(const Scope&) = delete;
    Scope& operator=(const Scope&) = delete;

   private:
    locale_t _before;
  };

 private:
  locale_t _locale;
};

}  // namespace tavisk
