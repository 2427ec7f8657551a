// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <utility>
#include <variant>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/RemoteServerSettings.h"

namespace tavisk {
namespace {

/// A call of a handler of any kind; an argument that is not there is the empty string.
struct Call {
  ServerCommands& commands;
  std::span<const std::string> arguments;

  std::string argument(std::size_t index) const { return index < arguments.size() ? arguments[index] : std::string(); }
  void operator()(void (ServerCommands::*handler)()) const { (commands.*handler)(); }
  void operator()(void (ServerCommands::*handler)(const std::string&)) const { (commands.*handler)(argument(0)); }
  void operator()(void (ServerCommands::*handler)(const std::string&, const std::string&)) const {
    (commands.*handler)(argument(0), argument(1));
  }
};

}  // namespace

bool RemoteServerSettings::loadCommands() {
  if (!_commandTable.data()) {
    _context.output.putLine("Error: Command info could not be found.");
    return false;
  }
  auto table = CommandTable::parse(_commandTable);
  if (!table) {
    _context.output.putLine("Error: Command info could not be translated.");
    return false;
  }
  _commandDict = std::make_shared<const CommandTable>(std::move(table).value());
  return true;
}

void RemoteServerSettings::parseCommandLineArgumentsAndExit(int argc, char** withArguments) {
  _serverCommands->setInteractive(false);
  parseCommand({withArguments + 1, withArguments + argc});
}

std::vector<std::string> RemoteServerSettings::getCommandArray(const std::string& line) {
  return split(line, " ");
}

void RemoteServerSettings::parseCommand(const std::vector<std::string>& words) {
  if (words.empty()) {
    _context.output.putLine("Error, buffer == NULL");
    return;
  }
  std::span<const std::string> rest(words);
  if (words.front() == "-f") {
    setPromptUser(false);
    rest = rest.subspan(1);
  }
  while (!rest.empty() && !_ended) {
    const auto taken = runFirst(rest);
    if (!taken) return;
    rest = rest.subspan(std::min(*taken, rest.size()));
  }
}

std::optional<std::size_t> RemoteServerSettings::runFirst(std::span<const std::string> words) {
  const auto& word = words.front();
  const auto* entry = _commandDict->findTyped(word);
  if (!entry) {
    refuseWord(word);
    return std::nullopt;
  }
  if (entry->arguments < 0 || entry->arguments > 2) {
    _context.output.print("Error: Invalid Number of Arguments: %ld\n", entry->arguments);
    return 0;
  }
  const auto count = static_cast<std::size_t>(entry->arguments);
  const auto arguments = words.subspan(1, std::min(count, words.size() - 1));
  const auto broken = std::ranges::find_if_not(arguments, isUtf8);
  if (broken != arguments.end()) {
    refuseWord(*broken);
    return std::nullopt;
  }
  callHandler(word, *entry, arguments);
  return 1 + count;
}

void RemoteServerSettings::callHandler(const std::string& word, const CommandTable::Entry& entry,
                                       std::span<const std::string> arguments) {
  if (_context.record) {
    _context.output.takePrinted();
    _context.record->commandBegins(word, arguments, entry.selector);
  }
  const auto limit = _context.runLoop.limitWaits(_context.longestCommand);
  std::visit(Call{*_serverCommands, arguments}, handlerNamed(entry.selector));
  if (_context.record) _context.record->commandEnds(_serverCommands->error(), _context.output.takePrinted());
  _effects.commandEnds();
}

void RemoteServerSettings::refuseWord(const std::string& word) {
  _context.output.takePrinted();
  _context.output.print("Error: %s is not a valid command\n", word.c_str());
  if (_context.record) _context.record->wordRefused(word, _serverCommands->error(), _context.output.takePrinted());
  _effects.commandEnds();
}

}  // namespace tavisk
