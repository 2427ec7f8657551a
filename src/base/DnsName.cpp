// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/DnsName.h"

#include <arpa/inet.h>

#include <algorithm>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t longestName = 253;
constexpr std::size_t longestLabel = 63;

/// `alsoAllowed` stands for what a label may have besides letters and digits.
bool isLabel(std::string_view label, std::string_view alsoAllowed) {
  if (label.empty() || label.size() > longestLabel || label.front() == '-' || label.back() == '-') return false;
  return std::ranges::all_of(
      label, [&](char c) { return isLetterOrDigit(c) || alsoAllowed.find(c) != std::string_view::npos; });
}

bool areLabels(std::string_view name, std::string_view alsoAllowed) {
  if (name.size() > longestName) return false;
  for (auto dot = name.find('.'); dot != std::string_view::npos; dot = name.find('.')) {
    if (!isLabel(name.substr(0, dot), alsoAllowed)) return false;
    name.remove_prefix(dot + 1);
  }
  return isLabel(name, alsoAllowed);
}

}  // namespace

bool isDnsName(std::string_view name) {
  return areLabels(name, "-");
}

bool isHostNameOrAddress(const std::string& text) {
  in6_addr address{};
  const bool holdsNul = text.find('\0') != std::string::npos;
  if (!holdsNul && ::inet_pton(AF_INET6, text.c_str(), &address) == 1) return true;
  const std::string_view name = text;
  return areLabels(name.substr(0, name.size() - (name.ends_with('.') ? 1 : 0)), "-_");
}

std::string firstLabel(const std::string& name) {
  return name.substr(0, name.find('.'));
}

}  // namespace tavisk
