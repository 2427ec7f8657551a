// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <memory>
#include <optional>

#include "base/DnsName.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr const char* sessionName = "RemoteServerSettings";

}  // namespace

void ServerCommands::getComputerName() {
  showName("Computer Name", "getcomputername", &DynamicStore::Session::computerName);
}

void ServerCommands::getLocalSubnetName() {
  showName("Local Subnet Name", "getlocalsubnetname", &DynamicStore::Session::localHostName);
}

void ServerCommands::showName(const char* label, const char* command,
                              std::optional<std::string> (DynamicStore::Session::*read)()) {
  setError(false);
  const std::unique_ptr<DynamicStore::Session> session = _context.host.dynamicStore().open(sessionName);
  if (!session) return;
  if (const std::optional<std::string> name = (*session.*read)()) {
    _context.output.print("%s: %s\n", label, name->c_str());
  } else {
    _context.output.print("%s: Error reading from dynamic store (name == NULL)!\n", command);
  }
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
  }
  setError(false);
}

HandlerRows computerNameHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getComputerName", &ServerCommands::getComputerName},
      {"setComputerName:", &ServerCommands::setComputerName},
      {"getLocalSubnetName", &ServerCommands::getLocalSubnetName},
      {"setLocalSubnetName:", &ServerCommands::setLocalSubnetName},
  };
  return rows;
}

}  // namespace tavisk
