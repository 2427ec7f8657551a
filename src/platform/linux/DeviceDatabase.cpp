// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/DeviceDatabase.h"

#include <algorithm>
#include <charconv>
#include <string_view>

#include "platform/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t recordLimit = std::size_t{1} << 20U;

std::string decoded(std::string_view text) {
  std::string plain;
  while (!text.empty()) {
    unsigned char byte = 0;
    const auto digits = text.substr(std::min<std::size_t>(2, text.size()), 2);
    const bool isEscape = text.starts_with("\\x") && digits.size() == 2 &&
                          std::from_chars(digits.data(), digits.data() + 2, byte, 16).ptr == digits.data() + 2;
    plain += isEscape ? static_cast<char>(byte) : text.front();
    text.remove_prefix(isEscape ? 4 : 1);
  }
  return plain;
}

}  // namespace

DeviceProperties DeviceProperties::ofBlockDevice(const SystemRoot& root, DeviceNumber number) {
  DeviceProperties properties;
  const auto file = "/run/udev/data/b" + std::to_string(number.major) + ":" + std::to_string(number.minor);
  for (const auto& line : split(root.read(file, recordLimit).valueOr(""), "\n")) {
    const auto equals = line.find('=');
    if (line.starts_with("E:") && equals != std::string::npos)
      properties._values[line.substr(2, equals - 2)] = line.substr(equals + 1);
  }
  return properties;
}

std::optional<std::string> DeviceProperties::find(const std::string& name) const {
  const auto found = _values.find(name);
  return found == _values.end() ? std::nullopt : std::optional(found->second);
}

bool DeviceProperties::isAnySet(const std::string& beginning) const {
  for (auto entry = _values.lower_bound(beginning); entry != _values.end(); ++entry) {
    if (!entry->first.starts_with(beginning)) return false;
    if (entry->second == "1") return true;
  }
  return false;
}

std::optional<std::string> DeviceProperties::findEncoded(const std::string& name) const {
  const auto value = find(name);
  return value ? std::optional(decoded(*value)) : std::nullopt;
}

}  // namespace tavisk
