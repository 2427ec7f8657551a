// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <optional>

#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

/// Absent when the word is none of the four.
std::optional<bool> readYesNo(const std::string& value) {
  if (caseInsensitiveEqualTo(value, "Yes") || caseInsensitiveEqualTo(value, "On")) return true;
  if (caseInsensitiveEqualTo(value, "No") || caseInsensitiveEqualTo(value, "Off")) return false;
  return std::nullopt;
}

}  // namespace

void ServerCommands::getDisableKeyBoardWhenEnclosureLockIsEngaged() {
  const auto value = _context.host.preferences().value(DunmereLockEnclosureStateKey).value_or(false);
  if (const auto* isDisabled = value.asBoolean()) {
    _context.output.print("getdisablekeyboardwhenenclosurelockisengaged: %s\n", *isDisabled ? "Yes" : "No");
  } else {
    _context.output.putLine("getdisablekeyboardwhenenclosurelockisengaged: error reading from preferences");
  }
}

void ServerCommands::setDisableKeyBoardWhenEnclosureLockIsEngaged(const std::string& yesNo) {
  if (checkForEmptyString(yesNo, "setdisablekeyboardwhenenclosurelockisengaged", "either 'Yes' or 'No'",
                          "setdisablekeyboardwhenenclosurelockisengaged <yes no>")) {
    return;
  }
  // Any other word is passed over without a message.
  const auto isDisabled = readYesNo(yesNo);
  if (!isDisabled) return refuse("'Yes' or 'No'");
  auto& utilities = _context.host.processes();
  utilities.setLockEnclosureState(*isDisabled);
  utilities.setMachineBoolean(DunmereLockEnclosureStateKey, *isDisabled);
  utilities.writeMachinePreferences();
  _context.output.print("setdisablekeyboardwhenenclosurelockisengaged: %s\n", *isDisabled ? "Yes" : "No");
}

HandlerRows keyboardLockHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getDisableKeyBoardWhenEnclosureLockIsEngaged", &ServerCommands::getDisableKeyBoardWhenEnclosureLockIsEngaged},
      {"setDisableKeyBoardWhenEnclosureLockIsEngaged:", &ServerCommands::setDisableKeyBoardWhenEnclosureLockIsEngaged},
  };
  return rows;
}

}  // namespace tavisk
