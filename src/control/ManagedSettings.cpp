// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/ManagedSettings.h"

#include <algorithm>
#include <array>

#include "base/Text.h"
#include "effects/SettingNames.h"

namespace tavisk::control {
namespace {

constexpr ManagedSetting settings[] = {
    {setting::time, "-gettime", "-settime", ValueKind::moment},
    {setting::timeZone, "-gettimezone", "-settimezone", ValueKind::text},
    {setting::networkTime, "-getusingnetworktime", "-setusingnetworktime", ValueKind::onOff},
    {setting::networkTimeServer, "-getnetworktimeserver", "-setnetworktimeserver", ValueKind::text, false, true},
    {setting::computerSleep, "-getcomputersleep", "-setcomputersleep", ValueKind::minutes},
    {setting::displaySleep, "-getdisplaysleep", "-setdisplaysleep", ValueKind::minutes},
    {setting::hardDiskSleep, "-getharddisksleep", "-setharddisksleep", ValueKind::minutes},
    {setting::wakeOnModem, "-getwakeonmodem", "-setwakeonmodem", ValueKind::onOff},
    {setting::wakeOnNetworkAccess, "-getwakeonnetworkaccess", "-setwakeonnetworkaccess", ValueKind::onOff},
    {setting::restartAfterPowerFailure, "-getrestartpowerfailure", "-setrestartpowerfailure", ValueKind::onOff},
    {setting::restartAfterFreeze, "-getrestartfreeze", "-setrestartfreeze", ValueKind::onOff},
    {setting::powerButtonSleep, "-getallowpowerbuttontosleepcomputer", "-setallowpowerbuttontosleepcomputer",
     ValueKind::onOff},
    {setting::startupDelay, "-getwaitforstartupafterpowerfailure", "-setwaitforstartupafterpowerfailure",
     ValueKind::startupDelay},
    {setting::remoteLogin, "-getremotelogin", "-setremotelogin", ValueKind::onOff},
    {setting::remoteEvents, "-getremotevelmarevents", "-setremotevelmarevents", ValueKind::onOff},
    {setting::computerName, "-getcomputername", "-setcomputername", ValueKind::text},
    {setting::localSubnetName, "-getlocalsubnetname", "-setlocalsubnetname", ValueKind::text},
    {setting::kernelArchitecture, "-getkernelbootarchitecturesetting", "-setkernelbootarchitecture",
     ValueKind::architecture},
    {setting::keyboardLockPreference, "-getdisablekeyboardwhenenclosurelockisengaged",
     "-setdisablekeyboardwhenenclosurelockisengaged", ValueKind::onOff},
    {setting::startupDisk, "-getstartupdisk", "-setstartupdisk", ValueKind::startupDisk, true},
};

std::string bare(std::string_view text) {
  auto letters = lowerCased(text);
  std::erase_if(letters, [](char c) { return c == ' ' || c == '-' || c == '_'; });
  return letters;
}

}  // namespace

std::span<const ManagedSetting> managedSettings() {
  return settings;
}

const ManagedSetting* managedNamed(std::string_view name) {
  const auto* const found = std::ranges::find(settings, name, &ManagedSetting::name);
  return found == std::end(settings) ? nullptr : found;
}

const ManagedSetting* settingMeantBy(std::string_view text) {
  constexpr auto prefix = std::string_view("-get").size();
  const auto meant = bare(text);
  const auto* const found = std::ranges::find_if(
      settings, [&](const auto& row) { return bare(row.name) == meant || row.getter.substr(prefix) == meant; });
  return found == std::end(settings) ? nullptr : found;
}

Result<std::vector<const ManagedSetting*>> settingsMeantBy(std::span<const std::string> texts) {
  std::vector<const ManagedSetting*> meant;
  for (const auto& text : texts) {
    const auto* setting = settingMeantBy(text);
    if (!setting) return Failure{"there is no setting " + text, "", "'taviskctl status --all' shows the names"};
    if (std::ranges::find(meant, setting) == meant.end()) meant.push_back(setting);
  }
  return meant;
}

}  // namespace tavisk::control
