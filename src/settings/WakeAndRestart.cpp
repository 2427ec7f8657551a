// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <optional>

#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

/// A switch that is kept for each power source and that not every machine has.
struct SourceSwitch {
  PowerSwitch which;
  const char* label;
  const char* setter;
  const char* usage;
};

namespace {

constexpr const char* onOrOff = "either 'On' or 'Off'";

constexpr SourceSwitch wakeOnModem = {PowerSwitch::wakeOnModem, "Wake On Modem", "setwakeonmodem",
                                      "setwakeonmodem <on off>"};
constexpr SourceSwitch wakeOnNetworkAccess = {PowerSwitch::wakeOnNetworkAccess, "Wake On Network Access",
                                              "setwakeonnetworkaccess", "setwakeonnetworkaccess <on off>"};
constexpr SourceSwitch restartPowerFailure = {PowerSwitch::restartAfterPowerFailure, "Restart After Power Failure",
                                              "setrestartpowerfailure", "setrestartpowerfailure <on off>"};

const char* wordFor(bool on) {
  return on ? "On" : "Off";
}

}  // namespace

void ServerCommands::getWakeOnModem() {
  showSourceSwitch(wakeOnModem);
}

void ServerCommands::setWakeOnModem(const std::string& onOff) {
  setSourceSwitch(wakeOnModem, onOff);
}

void ServerCommands::getWakeOnNetworkAccess() {
  showSourceSwitch(wakeOnNetworkAccess);
}

void ServerCommands::setWakeOnNetworkAccess(const std::string& onOff) {
  setSourceSwitch(wakeOnNetworkAccess, onOff);
}

void ServerCommands::getRestartPowerFailure() {
  showSourceSwitch(restartPowerFailure);
}

void ServerCommands::setRestartPowerFailure(const std::string& onOff) {
  setSourceSwitch(restartPowerFailure, onOff);
}

void ServerCommands::showSourceSwitch(const SourceSwitch& row) {
  PowerSettingsService& power = _context.host.powerSettings();
  const bool supported = power.supports(row.which, {getPMKey()});
  _context.output.print("%s: %s\n", row.label,
                        supported ? wordFor(power.isOn(row.which, {getPMKey()})) : "Not supported on this machine.");
  setError(false);
}

void ServerCommands::setSourceSwitch(const SourceSwitch& row, const std::string& onOff) {
  PowerSettingsService& power = _context.host.powerSettings();
  setError(false);
  if (checkForEmptyString(onOff, row.setter, onOrOff, row.usage)) return;
  if (!power.canSet(row.which, {getPMKey()})) {
    _context.output.print("%s: Not supported on this machine.\n", row.label);
    setError(true);
    return;
  }
  const std::optional<bool> on = readOnOff(onOff, row.setter);
  if (!on) return;
  power.setOn(row.which, {getPMKey()}, *on);
  _context.output.print("%s: %s\n", row.setter, wordFor(*on));
}

void ServerCommands::getRestartFreeze() {
  _context.output.print("Restart After Freeze: %s\n", wordFor(_context.host.powerSettings().restartsAfterFreeze()));
  setError(false);
}

void ServerCommands::setRestartFreeze(const std::string& onOff) {
  PowerSettingsService& power = _context.host.powerSettings();
  setError(false);
  if (checkForEmptyString(onOff, "setrestartfreeze", onOrOff, "setrestartfreeze <on off>")) return;
  if (const std::optional<bool> on = readOnOff(onOff, "setrestartfreeze")) power.setRestartsAfterFreeze(*on);
}

void ServerCommands::getAllowPowerButtonToSleepComputer() {
  PowerSettingsService& power = _context.host.powerSettings();
  const bool supported = power.supports(PowerSwitch::powerButtonSleep, {getPMKey()});
  _context.output.print("getAllowPowerButtonToSleepComputer: %s\n",
                        supported ? wordFor(power.isOn(PowerSwitch::powerButtonSleep, {getPMKey()}))
                                  : "Error, this feature is not supported on this machine.");
  setError(false);
}

void ServerCommands::setAllowPowerButtonToSleepComputer(const std::string& onOff) {
  if (!checkForEmptyString(onOff, "setallowpowerbuttontosleepcomputer", onOrOff,
                           "setallowpowerbuttontosleepcomputer <on off>")) {
    allowPowerButton(onOff);
  }
  // Whatever happened, an empty word included.
  setError(false);
}

void ServerCommands::allowPowerButton(const std::string& onOff) {
  PowerSettingsService& power = _context.host.powerSettings();
  if (!power.canSet(PowerSwitch::powerButtonSleep, {getPMKey()})) {
    _context.output.putLine(
        "setallowpowerbuttontosleepcomputer: Error, this feature is not supported on this machine.");
    return;
  }
  const bool off = caseInsensitiveEqualTo(onOff, "Off");
  // Any other word changes nothing, and is answered as "On" is.
  if (off || caseInsensitiveEqualTo(onOff, "On")) power.setOn(PowerSwitch::powerButtonSleep, {getPMKey()}, !off);
  _context.output.print("setallowpowerbuttontosleepcomputer: %s\n", wordFor(!off));
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
