// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

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
