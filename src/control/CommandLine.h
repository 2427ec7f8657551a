// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"

namespace tavisk::control {

/// An option of a command, without a value.
struct OptionRow {
  std::string_view name;  ///< "--json"
  std::string_view summary;
};

/// What may stand in the place of a command's operands, as completions know it.
enum class OperandKind { settings };

/// A command of taviskctl.
struct CommandRow {
  std::string_view name;
  std::string_view operands;  ///< "[SETTING...]"
  OperandKind kind;
  std::string_view summary;  ///< one sentence
  std::span<const OptionRow> options;
};

/// Every command, in the order of the help.
std::span<const CommandRow> commandRows();
/// Those that every command has, and that may stand alone.
std::span<const OptionRow> commonOptions();

/// A command line of which nothing is to be asked any more but whether the operands make sense.
struct Invocation {
  const CommandRow* command = nullptr;  ///< null: only a common option was given
  std::vector<std::string_view> options = {};
  std::vector<std::string> operands = {};

  bool has(std::string_view option) const;
};

/// The words after the program's name. Options may stand anywhere before "--". The failure says what is wrong with
/// which word.
Result<Invocation> readCommandLine(std::span<const std::string> words);

/// What `--help` prints: of the command, or of the program where that is null.
std::string helpText(const CommandRow* command);

}  // namespace tavisk::control
