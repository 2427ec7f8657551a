// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

void ServerCommands::getRemoteVelmarEvents() {
  _context.output.print("Remote Velmar Events: %s\n", _context.host.remoteEvents().isEnabled() ? "On" : "Off");
  setError(false);
}

void ServerCommands::setRemoteVelmarEvents(const std::string& onOff) {
  auto& remoteEvents = _context.host.remoteEvents();
  const auto state = remoteEvents.state();
  setError(false);
  if (checkForEmptyString(onOff, "setremotevelmarevents", "either 'On' or 'Off'", "setremotevelmarevents <on off>")) {
    return;
  }
  const auto isOn = readOnOff(onOff, "setremotevelmarevents");
  if (!isOn) return;
  const bool isThere = isWholly(state, *isOn);
  // A machine that cannot have them says so.
  if (!isThere || state == RemoteAccessState::unsupported) remoteEvents.setEnabled(*isOn);
  if (isThere) {
    _context.output.print("setremotevelmarevents: remote velmar events are already %s.\n", *isOn ? "on" : "off");
  } else {
    _context.output.print("setremotevelmarevents: %s\n", *isOn ? "On" : "Off");
  }
}

HandlerRows remoteEventsHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getRemoteVelmarEvents", &ServerCommands::getRemoteVelmarEvents},
      {"setRemoteVelmarEvents:", &ServerCommands::setRemoteVelmarEvents},
  };
  return rows;
}

}  // namespace tavisk
