// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <optional>

#include "base/DnsName.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr const char* sessionName = "RemoteServerSettings";

using NameOfSession = std::optional<std::string> (DynamicStore::Session::*)();

void showName(ServerCommands& commands, const char* label, const char* command, NameOfSession read) {
  const auto& context = commands.context();
  commands.setError(false);
  const auto session = context.host.dynamicStore().open(sessionName);
  if (!session) return;
  if (const auto name = (*session.*read)()) {
    context.output.print("%s: %s\n", label, name->c_str());
  } else {
    context.output.print("%s: Error reading from dynamic store (name == NULL)!\n", command);
  }
}

}  // namespace

void ServerCommands::getComputerName() {
  showName(*this, "Computer Name", "getcomputername", &DynamicStore::Session::computerName);
}

void ServerCommands::getLocalSubnetName() {
  showName(*this, "Local Subnet Name", "getlocalsubnetname", &DynamicStore::Session::localHostName);
}

void ServerCommands::setComputerName(const std::string& name) {
  _context.host.hostConfiguration().setComputerName(name);
  _context.output.print("setcomputername: %s\n", name.c_str());
  setError(false);
}

void ServerCommands::setLocalSubnetName(const std::string& name) {
  if (isDnsName(name)) {
    _context.host.hostConfiguration().setLocalNetworkName(name);
    _context.output.print("setlocalsubnetname: %s\n", name.c_str());
  } else {
    _context.output.print("setlocalsubnetname: Error, %s is not a valid name!\n", name.c_str());
    refuse("a DNS name: parts of 1 to 63 letters, digits and inner hyphens, joined by dots, at most 253 in all");
  }
  setError(false);
}

HandlerRows namesHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getComputerName", &ServerCommands::getComputerName},
      {"setComputerName:", &ServerCommands::setComputerName},
      {"getLocalSubnetName", &ServerCommands::getLocalSubnetName},
      {"setLocalSubnetName:", &ServerCommands::setLocalSubnetName},
  };
  return rows;
}

}  // namespace tavisk
