// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "frontend/ArgumentKinds.h"

namespace tavisk {

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
