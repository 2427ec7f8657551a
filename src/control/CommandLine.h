// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"

namespace tavisk::control {

/// An option of a command. Its value is the word after it.
struct OptionRow {
  std::string_view name;  ///< "--json"
  std::string_view summary;
  std::string_view value = {};  ///< how the help names its value, "FILE"; empty: it has none
};

/// What stands in the place of a command's operands.
enum class OperandKind {
  settings,  ///< names of settings
  none,
  words,  ///< words of tavisk and their values: from the first that does not begin with two hyphens, all are operands,
          ///< but "-f" in front of them, which is passed over
};

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
  /// By name, with their values: empty for those that have none. What is given twice counts as given last.
  std::map<std::string_view, std::string> options = {};
  std::vector<std::string> operands = {};

  bool has(std::string_view option) const { return options.contains(option); }
};

/// The words after the program's name. Options may stand anywhere before "--". The failure says what is wrong with
/// which word.
Result<Invocation> readCommandLine(std::span<const std::string> words);

/// What `--help` prints: of the command, or of the program where that is null.
std::string helpText(const CommandRow* command);

}  // namespace tavisk::control
