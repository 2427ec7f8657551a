// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

void ServerCommands::getUsingNetworkTime() {
  _context.output.putLine(_context.host.networkTime().isRunning() ? "Network Time: On" : "Network Time: Off");
  setError(false);
}

void ServerCommands::setUsingNetworkTime(const std::string& onOff) {
  setError(false);
  if (checkForEmptyString(onOff, "setusingnetworktime", "either 'On' or 'Off'", "setusingnetworktime <on off>")) return;
  const auto isOn = readOnOff(onOff, "setusingnetworktime");
  if (!isOn) return;
  auto& client = _context.host.networkTime();
  if (client.isRunning() == *isOn) {
    _context.output.putLine(*isOn ? "Network Time is already on." : "Network Time is already off.");
    client.checkLaunchAtStartup(*isOn);
    return;
  }
  client.setLaunchAtStartup(*isOn);
  *isOn ? client.start() : client.stop();
  _context.output.print("setUsingNetworkTime: %s\n", *isOn ? "On" : "Off");
}

void ServerCommands::getNetworkTimeServer() {
  const auto server = _context.host.networkTime().server();
  _context.output.print("Network Time Server: %s\n", server.address.c_str());
  setError(false);
}

void ServerCommands::setNetworkTimeServer(const std::string& address) {
  setError(false);
  if (checkForEmptyString(address, "setnetworktimeserver", "a valid time server", "setnetworktimeserver <timeserver>"))
    return;
  auto& client = _context.host.networkTime();
  client.setServer({address});
  if (client.isRunning()) client.restartAsynchronously();
  _context.output.print("setNetworkTimeServer: %s\n", address.c_str());
}

HandlerRows networkTimeHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getUsingNetworkTime", &ServerCommands::getUsingNetworkTime},
      {"setUsingNetworkTime:", &ServerCommands::setUsingNetworkTime},
      {"getNetworkTimeServer", &ServerCommands::getNetworkTimeServer},
      {"setNetworkTimeServer:", &ServerCommands::setNetworkTimeServer},
  };
  return rows;
}

}  // namespace tavisk
