// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace tavisk {

/// What is to stand instead of a typed word: the one candidate, with a space behind unless it goes on after a "/"; of
/// several candidates what they begin with, when that is more than was typed. Empty when there is nothing to add.
std::string completedWord(std::string_view typed, const std::vector<std::string>& candidates);

/// The candidates in columns, down and then right, as many as fit on a screen so many characters wide; with a newline
/// at the end. The first few hundred of them: how many are missing is said below.
std::string columnsOf(const std::vector<std::string>& candidates, std::size_t width);

}  // namespace tavisk
