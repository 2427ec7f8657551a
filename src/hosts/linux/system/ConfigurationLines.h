// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

/// What is read of a configuration file; a larger one is a failure.
inline constexpr std::size_t configurationLimit = std::size_t{1} << 20U;

/// The lines of a configuration that say something, trimmed: not the empty ones, nor those that begin with one of the
/// comment signs.
std::vector<std::string> configurationLines(std::string_view text, std::string_view commentSigns = "#");

/// A line "name = value".
struct NamedValue {
  std::string name;
  std::string value;
};

/// A line cut at its first sign, both parts trimmed; absent when it has no sign.
std::optional<NamedValue> namedValueIn(std::string_view line, char sign = '=');

}  // namespace tavisk
