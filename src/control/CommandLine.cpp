// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/CommandLine.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <utility>

namespace tavisk::control {
namespace {

constexpr OptionRow common[] = {
    {"--help", "Print this help."},
    {"--version", "Print the version."},
};

constexpr OptionRow statusOptions[] = {
    {"--all", "Show the startup disk too, for which every disk is looked at."},
    {"--json", "Print one JSON object instead of a table."},
};

constexpr OptionRow rehearseOptions[] = {
    {"--from", "Take settings and values from a JSON file; '-' is standard input.", "FILE"},
    {"--keep", "Make the copy of the machine in this folder, and leave it there.", "DIR"},
    {"--skip-unsupported", "What this machine cannot have does not count."},
    {"--allow-lockout", "Turn remote login off too, where that is asked for."},
    {"--json", "Print one JSON object instead of a table."},
};

constexpr OptionRow applyOptions[] = {
    {"--from", "Take settings and values from a JSON file; '-' is standard input.", "FILE"},
    {"--skip-unsupported", "What this machine cannot have does not count."},
    {"--allow-lockout", "Turn remote login off too, where that is asked for."},
    {"--json", "Print one JSON object instead of a table."},
};

constexpr OptionRow undoOptions[] = {
    {"--last", "Take back what the last run that changed something has done, as without --since."},
    {"--since", "Take back what was done since then: \"2026-11-22 14:30\", today, yesterday, -2h.", "TIME"},
    {"--run", "Do it."},
    {"--force", "Take back also what somebody else has changed since."},
    {"--allow-lockout", "Turn remote login off too, where it was off before."},
    {"--json", "Print one JSON object instead of a table."},
};

constexpr OptionRow resetOptions[] = {
    {"--json", "Print one JSON object instead of a table."},
};

constexpr CommandRow commands[] = {
    {"status", "[SETTING...]", OperandKind::settings,
     "Show settings: what is in force, what will be after a restart, where it is kept and what may undo it.",
     statusOptions},
    {"rehearse", "WORDS... | --from FILE", OperandKind::words,
     "Do it to a copy of the machine in files, and tell what would change, and what would be refused and why.",
     rehearseOptions},
    {"apply", "WORDS... | --from FILE", OperandKind::words,
     "Give settings the values asked for, where they differ, and tell what became of each.", applyOptions},
    {"undo", "", OperandKind::none, "Show what tavisk has changed and what each setting goes back to, or do it.",
     undoOptions},
    {"reset", "SETTING...", OperandKind::settings,
     "Take away what tavisk itself stores of settings, back to what the packages give.", resetOptions},
};

const OptionRow* findOption(std::span<const OptionRow> options, std::string_view name) {
  const auto found = std::ranges::find(options, name, &OptionRow::name);
  return found == options.end() ? nullptr : &*found;
}

const OptionRow* findOption(const CommandRow* command, std::string_view name) {
  const auto* own = command ? findOption(command->options, name) : nullptr;
  return own ? own : findOption(common, name);
}

bool takesWords(const CommandRow* command) {
  return command && command->kind == OperandKind::words;
}

/// The words of tavisk may begin with one hyphen.
bool isOption(std::string_view word, const CommandRow* command) {
  return word.starts_with(takesWords(command) ? "--" : "-");
}

/// By this word of tavisk nobody is asked anything, which here is so without it.
void dropPromptWord(Invocation& invocation) {
  auto& words = invocation.operands;
  if (takesWords(invocation.command) && !words.empty() && words.front() == "-f") words.erase(words.begin());
}

std::string behindBlank(std::string_view text) {
  return (text.empty() ? "" : " ") + std::string(text);
}

std::string typed(const OptionRow& option) {
  return std::string(option.name) + behindBlank(option.value);
}

/// The value of an option is the word after it.
std::string whatIsUnknown(const std::string& word, const CommandRow* command) {
  const auto* option = findOption(command, std::string_view(word).substr(0, word.find('=')));
  return option && !option->value.empty() ? word + ": its value stands apart, " + typed(*option)
                                          : "there is no option " + word;
}

Failure misused(const std::string& what, const CommandRow* command) {
  const std::string name = command ? std::string(command->name) + " " : "";
  return {what, "", "type 'taviskctl " + name + "--help'"};
}

std::string optionLines(std::span<const OptionRow> options) {
  constexpr std::size_t column = 20;
  std::string lines;
  for (const auto& option : options) {
    const auto words = typed(option);
    const std::size_t gap = column - std::min(column - 2, words.size());
    lines.append("  ").append(words).append(gap, ' ').append(option.summary).append("\n");
  }
  return lines;
}

std::string commandLines() {
  std::string lines;
  for (const auto& command : commands)
    lines.append("  ")
        .append(command.name)
        .append(behindBlank(command.operands))
        .append("\n      ")
        .append(command.summary)
        .append("\n");
  return lines;
}

}  // namespace

std::span<const CommandRow> commandRows() {
  return commands;
}

std::span<const OptionRow> commonOptions() {
  return common;
}

Result<Invocation> readCommandLine(std::span<const std::string> words) {
  Invocation invocation;
  bool areOptionsOver = false;
  const OptionRow* valued = nullptr;  // the option whose value is next
  for (const auto& word : words) {
    if (valued) {
      invocation.options[std::exchange(valued, nullptr)->name] = word;
    } else if (!areOptionsOver && word == "--") {
      areOptionsOver = true;
    } else if (!areOptionsOver && isOption(word, invocation.command)) {
      const auto* option = findOption(invocation.command, word);
      if (!option) return misused(whatIsUnknown(word, invocation.command), invocation.command);
      if (option->value.empty())
        invocation.options.try_emplace(option->name);
      else
        valued = option;
    } else if (!invocation.command) {
      const auto* const found = std::ranges::find(commands, word, &CommandRow::name);
      if (found == std::end(commands)) return misused("there is no command " + word, nullptr);
      invocation.command = found;
    } else {
      areOptionsOver = areOptionsOver || takesWords(invocation.command);
      invocation.operands.push_back(word);
    }
  }
  dropPromptWord(invocation);
  if (valued) return misused(typed(*valued) + ": the value is missing", invocation.command);
  if (!invocation.command && invocation.options.empty()) return misused("a command is missing", nullptr);
  if (invocation.command && invocation.command->kind == OperandKind::none && !invocation.operands.empty())
    return misused("what is " + invocation.operands.front(), invocation.command);
  return invocation;
}

std::string helpText(const CommandRow* command) {
  std::string text = "usage: taviskctl ";
  if (!command)
    return text + "COMMAND [OPTION...]\n\n" + commandLines() + "\n" + optionLines(common) +
           "\nThe manual is taviskctl(8).\n";
  text.append(command->name).append(" [OPTION...]").append(behindBlank(command->operands)).append("\n\n");
  text.append(command->summary).append("\n\n").append(optionLines(command->options)).append(optionLines(common));
  return text;
}

}  // namespace tavisk::control
