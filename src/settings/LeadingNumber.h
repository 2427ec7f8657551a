// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include "base/Text.h"

namespace tavisk {

/// Whether there is a number that leadingInteger() takes, rather than the 0 of a text without one.
inline bool beginsWithNumber(std::string_view text) {
  text = trimmed(text);
  if (text.starts_with('+') || text.starts_with('-')) text.remove_prefix(1);
  return !text.empty() && isDigit(text.front());
}

}  // namespace tavisk
