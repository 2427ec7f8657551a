// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

namespace tavisk {

/// "a, b, c", for people.
inline std::string commaList(const std::vector<std::string>& texts) {
  std::string list;
  for (const auto& text : texts) list.append(list.empty() ? "" : ", ").append(text);
  return list;
}

}  // namespace tavisk
