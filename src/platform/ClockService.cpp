// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/ClockService.h"

#include <algorithm>

#include "base/Text.h"

namespace tavisk {
namespace {

bool isZoneCharacter(char c) {
  return isLetterOrDigit(c) || std::string_view("+-_/").find(c) != std::string_view::npos;
}

}  // namespace

bool ZoneName::isWellFormed() const {
  return !text.empty() && text.front() != '/' && text.back() != '/' && text.find("//") == std::string::npos &&
         std::ranges::all_of(text, isZoneCharacter);
}

bool ZoneName::staysInFolder() const {
  return !text.empty() && !text.starts_with('/') && text.find("..") == std::string::npos;
}

std::optional<ZoneName> zoneOfPath(std::string_view path) {
  constexpr std::string_view lastFolder = "/zoneinfo/";
  const auto start = path.find(lastFolder);
  if (start == std::string_view::npos) return std::nullopt;
  auto name = path.substr(start + lastFolder.size());
  for (const auto variant : ZoneName::variants)
    if (name.starts_with(variant)) name.remove_prefix(variant.size());
  const ZoneName zone{std::string(name)};
  return zone.isWellFormed() ? std::optional(zone) : std::nullopt;
}

std::string textOf(const std::vector<ZoneName>& zones) {
  std::string lines;
  for (const auto& zone : zones) lines += (lines.empty() ? "" : "\n") + zone.text;
  return lines;
}

}  // namespace tavisk
