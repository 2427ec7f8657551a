// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <clocale>

namespace tavisk {

/// UTF-8 as the character set of one thread, for a time. The locale of the process stays "C".
class Utf8Locale {
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
