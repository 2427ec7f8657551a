// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchUserDefaults.h"

namespace tavisk {

bool ScratchUserDefaults::boolean(const std::string& key) {
  const auto defaults = section();
  const auto* const value = defaults.find(key);
  return value != nullptr && value->asBoolean() != nullptr && *value->asBoolean();
}

std::optional<double> ScratchUserDefaults::number(const std::string& key) {
  const auto defaults = section();
  const auto* const value = defaults.find(key);
  if (value == nullptr) return std::nullopt;
  if (const auto* const integer = value->asInteger()) return static_cast<double>(*integer);
  return value->asReal() == nullptr ? std::nullopt : std::optional(*value->asReal());
}

std::vector<std::string> ScratchUserDefaults::strings(const std::string& key) {
  const auto defaults = section();
  const auto* const value = defaults.find(key);
  std::vector<std::string> strings;
  if (value == nullptr || value->asArray() == nullptr) return strings;
  for (const auto& member : *value->asArray())
    if (const auto* const text = member.asString()) strings.push_back(*text);
  return strings;
}

}  // namespace tavisk
