// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

/// A switch that is kept for each power source and that not every machine has.
struct SourceSwitch {
  PowerSwitch which;
  const char* label;
  const char* setter;
  const char* usage;
};

constexpr const char* onOrOff = "either 'On' or 'Off'";

constexpr SourceSwitch wakeOnModem = {PowerSwitch::wakeOnModem, "Wake On Modem", "setwakeonmodem",
                                      "setwakeonmodem <on off>"};
constexpr SourceSwitch wakeOnNetworkAccess = {PowerSwitch::wakeOnNetworkAccess, "Wake On Network Access",
                                              "setwakeonnetworkaccess", "setwakeonnetworkaccess <on off>"};
constexpr SourceSwitch restartPowerFailure = {PowerSwitch::restartAfterPowerFailure, "Restart After Power Failure",
                                              "setrestartpowerfailure", "setrestartpowerfailure <on off>"};

const char* wordFor(bool isOn) {
  return isOn ? "On" : "Off";
}

/// "On", "Off", or `otherwise` on a machine that does not have the switch.
const char* stateOf(PowerSettingsService& power, PowerSwitch which, const char* otherwise) {
  const PowerSource source{ServerCommands::getPMKey()};
  return power.supports(which, source) ? wordFor(power.isOn(which, source)) : otherwise;
}

void showSwitch(ServerCommands& commands, const SourceSwitch& row) {
  const auto& context = commands.context();
  context.output.print("%s: %s\n", row.label,
                       stateOf(context.host.powerSettings(), row.which, "Not supported on this machine."));
  commands.setError(false);
}

void setSwitch(ServerCommands& commands, const SourceSwitch& row, const std::string& onOff) {
  const auto& context = commands.context();
  auto& power = context.host.powerSettings();
  commands.setError(false);
  if (commands.checkForEmptyString(onOff, row.setter, onOrOff, row.usage)) return;
  if (!power.canSet(row.which, {ServerCommands::getPMKey()})) {
    context.output.print("%s: Not supported on this machine.\n", row.label);
    commands.setError(true);
    return;
  }
  const auto isOn = commands.readOnOff(onOff, row.setter);
  if (!isOn) return;
  power.setOn(row.which, {ServerCommands::getPMKey()}, *isOn);
  context.output.print("%s: %s\n", row.setter, wordFor(*isOn));
}

void allowPowerButton(ServerCommands& commands, const std::string& onOff) {
  const auto& context = commands.context();
  const PowerSource source{ServerCommands::getPMKey()};
  auto& power = context.host.powerSettings();
  if (!power.canSet(PowerSwitch::powerButtonSleep, source)) {
    context.output.putLine("setallowpowerbuttontosleepcomputer: Error, this feature is not supported on this machine.");
    return;
  }
  const auto isOff = caseInsensitiveEqualTo(onOff, "Off");
  // Any other word changes nothing, and is answered as "On" is.
  if (isOff || caseInsensitiveEqualTo(onOff, "On")) {
    power.setOn(PowerSwitch::powerButtonSleep, source, !isOff);
  } else {
    commands.refuse(onOrOff);
  }
  context.output.print("setallowpowerbuttontosleepcomputer: %s\n", wordFor(!isOff));
}

}  // namespace

void ServerCommands::getWakeOnModem() {
  showSwitch(*this, wakeOnModem);
}

void ServerCommands::setWakeOnModem(const std::string& onOff) {
  setSwitch(*this, wakeOnModem, onOff);
}

void ServerCommands::getWakeOnNetworkAccess() {
  showSwitch(*this, wakeOnNetworkAccess);
}

void ServerCommands::setWakeOnNetworkAccess(const std::string& onOff) {
  setSwitch(*this, wakeOnNetworkAccess, onOff);
}

void ServerCommands::getRestartPowerFailure() {
  showSwitch(*this, restartPowerFailure);
}

void ServerCommands::setRestartPowerFailure(const std::string& onOff) {
  setSwitch(*this, restartPowerFailure, onOff);
}

void ServerCommands::getRestartFreeze() {
  _context.output.print("Restart After Freeze: %s\n", wordFor(_context.host.powerSettings().restartsAfterFreeze()));
  setError(false);
}

void ServerCommands::setRestartFreeze(const std::string& onOff) {
  auto& power = _context.host.powerSettings();
  setError(false);
  if (checkForEmptyString(onOff, "setrestartfreeze", onOrOff, "setrestartfreeze <on off>")) return;
  if (const auto isOn = readOnOff(onOff, "setrestartfreeze")) power.setRestartsAfterFreeze(*isOn);
}

void ServerCommands::getAllowPowerButtonToSleepComputer() {
  _context.output.print("getAllowPowerButtonToSleepComputer: %s\n",
                        stateOf(_context.host.powerSettings(), PowerSwitch::powerButtonSleep,
                                "Error, this feature is not supported on this machine."));
  setError(false);
}

void ServerCommands::setAllowPowerButtonToSleepComputer(const std::string& onOff) {
  if (!checkForEmptyString(onOff, "setallowpowerbuttontosleepcomputer", onOrOff,
                           "setallowpowerbuttontosleepcomputer <on off>")) {
    allowPowerButton(*this, onOff);
  }
  // Whatever happened, an empty word included.
  setError(false);
}

HandlerRows wakeAndRestartHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getWakeOnModem", &ServerCommands::getWakeOnModem},
      {"setWakeOnModem:", &ServerCommands::setWakeOnModem},
      {"getWakeOnNetworkAccess", &ServerCommands::getWakeOnNetworkAccess},
      {"setWakeOnNetworkAccess:", &ServerCommands::setWakeOnNetworkAccess},
      {"getRestartPowerFailure", &ServerCommands::getRestartPowerFailure},
      {"setRestartPowerFailure:", &ServerCommands::setRestartPowerFailure},
      {"getRestartFreeze", &ServerCommands::getRestartFreeze},
      {"setRestartFreeze:", &ServerCommands::setRestartFreeze},
      {"getAllowPowerButtonToSleepComputer", &ServerCommands::getAllowPowerButtonToSleepComputer},
      {"setAllowPowerButtonToSleepComputer:", &ServerCommands::setAllowPowerButtonToSleepComputer},
  };
  return rows;
}

}  // namespace tavisk
