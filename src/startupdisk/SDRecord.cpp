// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDRecord.h"

#include "base/Text.h"
#include "startupdisk/SDLog.h"

namespace tavisk {

std::optional<std::string> SDRecord::textForKey(const std::string& key) const {
  const auto value = objectForKey(key);
  const auto* text = value ? std::get_if<std::string>(&*value) : nullptr;
  return text ? std::optional(*text) : std::nullopt;
}

std::optional<std::int64_t> SDRecord::integerForKey(const std::string& key) const {
  const auto value = objectForKey(key);
  if (!value) return std::nullopt;
  const auto* number = std::get_if<std::int64_t>(&*value);
  return number ? *number : leadingInteger(std::get<std::string>(*value));
}

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
