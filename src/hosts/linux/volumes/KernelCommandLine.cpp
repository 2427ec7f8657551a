// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/KernelCommandLine.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "base/Text.h"

namespace tavisk {
namespace {

bool isBlank(char c) {
  return c == ' ' || (c >= '\t' && c <= '\r');
}

/// As the kernel cuts its command line: quotes hold blanks together, and are no part of an argument.
std::vector<std::string> argumentsIn(std::string_view commandLine) {
  std::vector<std::string> arguments;
  std::string argument;
  bool isQuoted = false;
  for (const char c : commandLine) {
    if (c == '"') {
      isQuoted = !isQuoted;
    } else if (isQuoted || !isBlank(c)) {
      argument += c;
    } else if (!argument.empty()) {
      arguments.push_back(std::exchange(argument, {}));
    }
  }
  if (!argument.empty()) arguments.push_back(argument);
  return arguments;
}

/// The value of the last "NAME=" in a list.
std::optional<std::string> lastValue(const std::vector<std::string>& list, std::string_view name) {
  std::optional<std::string> value;
  for (const auto& item : list)
    if (item.starts_with(name)) value = item.substr(name.size());
  return value;
}

bool isTop(const std::string& subvolumeId) {
  return subvolumeId == "0" || subvolumeId == "5";
}

/// Absent when it cannot be told.
std::optional<std::string> subvolumeIn(const std::vector<std::string>& flags) {
  const auto path = lastValue(flags, "subvol=");
  if (path) return path->substr(std::min(path->find_first_not_of('/'), path->size()));
  const auto id = lastValue(flags, "subvolid=");
  return !id || isTop(*id) ? std::optional(std::string()) : std::nullopt;
}

}  // namespace

std::optional<RootArgument> rootIn(std::string_view commandLine) {
  const auto arguments = argumentsIn(commandLine);
  auto root = lastValue(arguments, "root=");
  if (!root || root->empty()) return std::nullopt;
  auto subvolume = subvolumeIn(split(lastValue(arguments, "rootflags=").value_or(""), ","));
  if (!subvolume) return std::nullopt;
  return RootArgument{*std::move(root), *std::move(subvolume)};
}

}  // namespace tavisk
