// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ConfigurationLines.h"

#include "base/Text.h"

namespace tavisk {

std::vector<std::string> configurationLines(std::string_view text, std::string_view commentSigns) {
  std::vector<std::string> lines;
  for (const auto& each : split(text, "\n")) {
    const auto line = trimmed(each);
    if (!line.empty() && commentSigns.find(line.front()) == std::string_view::npos) lines.emplace_back(line);
  }
  return lines;
}

std::optional<NamedValue> namedValueIn(std::string_view line, char sign) {
  const auto place = line.find(sign);
  if (place == std::string_view::npos) return std::nullopt;
  return NamedValue{std::string(trimmed(line.substr(0, place))), std::string(trimmed(line.substr(place + 1)))};
}

}  // namespace tavisk
