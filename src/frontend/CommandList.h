// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

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

/// A command for those who are to choose one: completion and documents.
struct ListedCommand {
  std::string word;         ///< lower case, with its dash
  ArgumentKind argument;    ///< none: the command takes no argument
  std::string placeholder;  ///< of the argument, "<mm:dd:yy>"; empty when there is none
  std::string summary;      ///< one sentence
};

/// Every command of the product's table: those that help shows, in its order, then the others.
std::vector<ListedCommand> listCommands();

}  // namespace tavisk
