// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/EfiLoadOption.h"

#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

/// Takes a text up to its end, two NUL bytes in a place of their own.
std::optional<std::string> takeText(std::string_view& bytes) {
  for (std::size_t end = 0; end + 1 < bytes.size(); end += 2) {
    if (bytes[end] != '\0' || bytes[end + 1] != '\0') continue;
    auto text = fromUtf16(bytes.substr(0, end));
    bytes.remove_prefix(end + 2);
    return text;
  }
  return std::nullopt;
}

}  // namespace

bool EfiLoadOption::startsAs(const EfiLoadOption& other) const {
  return isStartedUnasked() == other.isStartedUnasked() && paths == other.paths && data == other.data;
}

std::optional<EfiLoadOption> parseLoadOption(std::string_view bytes) {
  const auto attributes = takeNumber(bytes, 4);
  const auto pathsSize = takeNumber(bytes, 2);
  if (!pathsSize) return std::nullopt;
  const auto description = takeText(bytes);
  if (!description || *pathsSize > bytes.size()) return std::nullopt;
  return EfiLoadOption{static_cast<std::uint32_t>(*attributes), *description, std::string(bytes.substr(0, *pathsSize)),
                       std::string(bytes.substr(*pathsSize))};
}

std::string bytesOf(const EfiLoadOption& option) {
  std::string bytes;
  appendNumber(bytes, option.attributes, 4);
  appendNumber(bytes, option.paths.size(), 2);
  bytes += toUtf16(option.description);
  appendNumber(bytes, 0, 2);
  return bytes + option.paths + option.data;
}

std::string targetText(const EfiLoadOption& option) {
  const auto path = parseDevicePath(option.paths);
  const auto text = path ? textOf(*path) : "a malformed device path";
  return option.data.empty() ? text : text + " with options of its own";
}

}  // namespace tavisk
