// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDImage.h"

#include "startupdisk/MessageFormat.h"

namespace tavisk {

std::optional<ContextValue> SDImage::objectForKey(const std::string& key) const {
  const auto value = _values.find(key);
  return value == _values.end() ? std::nullopt : std::optional(value->second);
}

std::string SDImage::description() const {
  std::string text;
  for (const auto& [key, value] : _values) {
    text += formatMessage(text.empty() ? "%@ = %@" : "; %@ = %@", {key, value});
  }
  return "{" + text + "}";
}

}  // namespace tavisk
