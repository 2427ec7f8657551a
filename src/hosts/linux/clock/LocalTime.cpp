// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LocalTime.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

constexpr const char* localTimeLink = "/etc/localtime";
constexpr const char* timeZoneFile = "/etc/timezone";
constexpr std::size_t timeZoneFileLimit = 4096;

bool isZoneCharacter(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
         std::string_view("+-_/").find(c) != std::string_view::npos;
}

bool isZoneName(std::string_view name) {
  return !name.empty() && name.front() != '/' && name.back() != '/' && name.find("//") == std::string_view::npos &&
         std::ranges::all_of(name, isZoneCharacter);
}

std::optional<std::string> zoneNamed(std::string_view name) {
  if (!isZoneName(name)) return std::nullopt;
  return std::string(name);
}

}  // namespace

std::optional<std::string> zoneOfPath(std::string_view path) {
  constexpr std::string_view folder = "/zoneinfo/";
  auto start = path.find(folder);
  if (start == std::string_view::npos) return std::nullopt;
  auto name = path.substr(start + folder.size());
  for (std::string_view variant : {"posix/", "right/"})
    if (name.starts_with(variant)) name.remove_prefix(variant.size());
  return zoneNamed(name);
}

std::optional<std::string> timeZoneFileName(const SystemRoot& root) {
  auto text = root.read(timeZoneFile, timeZoneFileLimit);
  if (!text) return std::nullopt;
  for (const auto& line : split(*text, "\n")) {
    auto words = split(line, " \t\r");
    if (!words.empty() && !words.front().starts_with('#')) return words.front();
  }
  return std::string();
}

std::optional<std::string> machineTimeZone(const SystemRoot& root) {
  if (auto target = root.readLink(localTimeLink))
    if (auto zone = zoneOfPath(*target)) return zone;
  auto name = timeZoneFileName(root);
  return name ? zoneNamed(*name) : std::nullopt;
}

Result<void> linkLocalTime(const SystemRoot& root, const std::string& zone) {
  auto file = zoneFolder + zone;
  if (!isZoneName(zone) || !root.exists(file)) return Failure{"set the time zone", file, "there is no such zone"};
  return root.writeLink(localTimeLink, ".." + file);
}

Result<void> updateTimeZoneFile(const SystemRoot& root, const std::string& zone) {
  if (!root.exists(timeZoneFile)) return {};
  return root.write(timeZoneFile, zone + "\n");
}

}  // namespace tavisk
