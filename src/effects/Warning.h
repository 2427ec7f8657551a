// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

namespace tavisk {

/// How a note begins that is told at the terminal too, of a change that was made.
inline constexpr std::string_view warningSign = "warning: ";

inline std::string warning(std::string_view text) {
  return std::string(warningSign).append(text);
}

}  // namespace tavisk
