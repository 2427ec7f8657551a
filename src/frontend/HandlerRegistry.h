// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <variant>

namespace tavisk {

class ServerCommands;

/// A handler with no, one or two arguments.
using Handler = std::variant<void (ServerCommands::*)(),                    //
                             void (ServerCommands::*)(const std::string&),  //
                             void (ServerCommands::*)(const std::string&, const std::string&)>;

/// One selector of the command table and the member function behind it.
struct HandlerRow {
  std::string_view selector;
  Handler handler;
};
using HandlerRows = std::span<const HandlerRow>;

/// The rows of each family, defined beside the family's handlers.
HandlerRows helpHandlers();
HandlerRows dateAndTimeHandlers();
HandlerRows timeZonesHandlers();
HandlerRows networkTimeHandlers();
HandlerRows sleepTimersHandlers();
HandlerRows wakeAndRestartHandlers();
HandlerRows startupDelayHandlers();
HandlerRows remoteLoginHandlers();
HandlerRows remoteEventsHandlers();
HandlerRows namesHandlers();
HandlerRows bootArchitectureHandlers();
HandlerRows keyboardLockHandlers();
HandlerRows startupDiskHandlers();

/// All families.
std::span<const HandlerRows> handlerFamilies();

/// Throws std::logic_error when no family has the selector: the table and the families are both the program's own.
const Handler& handlerNamed(std::string_view selector);

}  // namespace tavisk
