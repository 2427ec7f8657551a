// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "settings/DnsName.h"

#include <algorithm>

namespace tavisk {

namespace {

constexpr std::size_t longestName = 253;
constexpr std::size_t longestLabel = 63;

bool isLetterOrDigit(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
}

bool isLabel(std::string_view label) {
  if (label.empty() || label.size() > longestLabel) return false;
  if (label.front() == '-' || label.back() == '-') return false;
  return std::all_of(label.begin(), label.end(), [](char c) { return isLetterOrDigit(c) || c == '-'; });
}

}  // namespace

bool isDnsName(std::string_view name) {
  if (name.size() > longestName) return false;
  for (std::size_t dot = name.find('.'); dot != std::string_view::npos; dot = name.find('.')) {
    if (!isLabel(name.substr(0, dot))) return false;
    name.remove_prefix(dot + 1);
  }
  return isLabel(name);
}

}  // namespace tavisk
