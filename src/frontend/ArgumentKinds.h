// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string_view>

#include "frontend/Help.h"

namespace tavisk {

/// What can be typed as the argument of a command, as far as completions can tell.
enum class ArgumentKind {
  none,          ///< the command takes no argument
  onOff,         ///< a switch
  yesNo,         ///< a switch that is asked in other words
  minutes,       ///< a number, or a word for never
  timeZone,      ///< one of the zones that -listtimezones lists
  startupDisk,   ///< one of the disks that -liststartupdisks lists, by folder or by name
  architecture,  ///< of the kernel
  text,          ///< anything: dates, numbers, names, addresses
};

ArgumentKind argumentKind(const HelpEntry& command);

/// The words of the kind that are the same on each machine, as users are shown them; commands know them in any case.
/// Empty when the machine knows the values or when they are free.
std::span<const std::string_view> fixedValues(ArgumentKind kind);

}  // namespace tavisk
