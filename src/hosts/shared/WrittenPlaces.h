// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// The places that a change has written, for Setting::written.
class WrittenPlaces {
 public:
  void add(const std::string& place) { _text += (_text.empty() ? "" : ", ") + place; }
  void add(const WrittenPlaces& others) {
    if (!others._text.empty()) add(others._text);
  }
  const std::string& text() const { return _text; }

 private:
  std::string _text;
};

}  // namespace tavisk
