// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <optional>

#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

void ServerCommands::getRemoteVelmarEvents() {
  _context.output.print("Remote Velmar Events: %s\n", _context.host.remoteEvents().isEnabled() ? "On" : "Off");
  setError(false);
}

void ServerCommands::setRemoteVelmarEvents(const std::string& onOff) {
  RemoteEventsService& remoteEvents = _context.host.remoteEvents();
  const bool enabled = remoteEvents.isEnabled();
  setError(false);
  if (checkForEmptyString(onOff, "setremotevelmarevents", "either 'On' or 'Off'", "setremotevelmarevents <on off>")) {
    return;
  }
  const std::optional<bool> on = readOnOff(onOff, "setremotevelmarevents");
  if (!on) return;
  if (*on == enabled) {
    _context.output.print("setremotevelmarevents: remote velmar events are already %s.\n", enabled ? "on" : "off");
    return;
  }
  remoteEvents.setEnabled(*on);
  _context.output.print("setremotevelmarevents: %s\n", *on ? "On" : "Off");
}

HandlerRows remoteEventsHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getRemoteVelmarEvents", &ServerCommands::getRemoteVelmarEvents},
      {"setRemoteVelmarEvents:", &ServerCommands::setRemoteVelmarEvents},
  };
  return rows;
}

}  // namespace tavisk
