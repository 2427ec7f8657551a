// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>

namespace tavisk {

/// Of the programs, as they print it.
inline constexpr const char* versionText = "1.4a1";

/// What users are told of one command.
struct HelpEntry {
  const char* word;         ///< "-setdate", as users are shown it
  const char* placeholder;  ///< of the argument, "<mm:dd:yy>"; empty when there is none
  const char* description;  ///< one or more lines, indented by a tab, without the last newline
};

/// The commands that help and command list show, in their order.
std::span<const HelpEntry> helpEntries();

}  // namespace tavisk
