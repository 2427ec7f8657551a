// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/ServerCommands.h"

#include <utility>

#include "frontend/RemotePrefsExtra.h"

namespace tavisk {

ServerCommands::ServerCommands(std::shared_ptr<const CommandTable> commandDict, const CommandContext& context)
    : _context(context), _commandDict(std::move(commandDict)) {}

ServerCommands::~ServerCommands() = default;

void ServerCommands::refuse(const std::string& expected) {
  if (_context.record) _context.record->argumentRefused(expected);
}

bool ServerCommands::checkForEmptyString(const std::string& value, const char* command, const char* withInfo,
                                         const char* andUseage) {
  if (!value.empty()) return false;
  _context.output.print("%s: Error, you must specify %s. Command usage: '%s'\n", command, withInfo, andUseage);
  refuse(withInfo);
  setError(true);
  return true;
}

std::optional<bool> ServerCommands::readOnOff(const std::string& value, const char* command) {
  if (caseInsensitiveEqualTo(value, "On")) return true;
  if (caseInsensitiveEqualTo(value, "Off")) return false;
  _context.output.print("%s: Error, %s is not recognized, Use 'On' or 'Off'\n", command, value.c_str());
  refuse("'On' or 'Off'");
  setError(true);
  return std::nullopt;
}

}  // namespace tavisk
