// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/HostName.h"

#include <arpa/inet.h>

#include <algorithm>
#include <string_view>

namespace tavisk {
namespace {

constexpr std::size_t longestName = 253;
constexpr std::size_t longestLabel = 63;

bool isLabelCharacter(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' || c == '_';
}

bool isLabel(std::string_view label) {
  return !label.empty() && label.size() <= longestLabel && label.front() != '-' && label.back() != '-' &&
         std::all_of(label.begin(), label.end(), isLabelCharacter);
}

bool isHostName(std::string_view name) {
  if (name.ends_with('.')) name.remove_suffix(1);
  if (name.size() > longestName) return false;
  for (auto dot = name.find('.'); dot != std::string_view::npos; dot = name.find('.')) {
    if (!isLabel(name.substr(0, dot))) return false;
    name.remove_prefix(dot + 1);
  }
  return isLabel(name);
}

}  // namespace

bool isHostNameOrAddress(const std::string& text) {
  in6_addr address{};
  const bool holdsNul = text.find('\0') != std::string::npos;
  return (!holdsNul && ::inet_pton(AF_INET6, text.c_str(), &address) == 1) || isHostName(text);
}

}  // namespace tavisk
