// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/ManagedSettings.h"

#include <algorithm>
#include <array>
#include <string>

#include "base/Text.h"
#include "effects/SettingNames.h"

namespace tavisk::control {
namespace {

constexpr ManagedSetting settings[] = {
    {setting::time, "-gettime", "-settime"},
    {setting::timeZone, "-gettimezone", "-settimezone"},
    {setting::networkTime, "-getusingnetworktime", "-setusingnetworktime"},
    {setting::networkTimeServer, "-getnetworktimeserver", "-setnetworktimeserver"},
    {setting::computerSleep, "-getcomputersleep", "-setcomputersleep"},
    {setting::displaySleep, "-getdisplaysleep", "-setdisplaysleep"},
    {setting::hardDiskSleep, "-getharddisksleep", "-setharddisksleep"},
    {setting::wakeOnModem, "-getwakeonmodem", "-setwakeonmodem"},
    {setting::wakeOnNetworkAccess, "-getwakeonnetworkaccess", "-setwakeonnetworkaccess"},
    {setting::restartAfterPowerFailure, "-getrestartpowerfailure", "-setrestartpowerfailure"},
    {setting::restartAfterFreeze, "-getrestartfreeze", "-setrestartfreeze"},
    {setting::powerButtonSleep, "-getallowpowerbuttontosleepcomputer", "-setallowpowerbuttontosleepcomputer"},
    {setting::startupDelay, "-getwaitforstartupafterpowerfailure", "-setwaitforstartupafterpowerfailure"},
    {setting::remoteLogin, "-getremotelogin", "-setremotelogin"},
    {setting::remoteEvents, "-getremotevelmarevents", "-setremotevelmarevents"},
    {setting::computerName, "-getcomputername", "-setcomputername"},
    {setting::localSubnetName, "-getlocalsubnetname", "-setlocalsubnetname"},
    {setting::kernelArchitecture, "-getkernelbootarchitecturesetting", "-setkernelbootarchitecture"},
    {setting::keyboardLockPreference, "-getdisablekeyboardwhenenclosurelockisengaged",
     "-setdisablekeyboardwhenenclosurelockisengaged"},
    {setting::startupDisk, "-getstartupdisk", "-setstartupdisk", true},
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

const ManagedSetting* settingMeantBy(std::string_view text) {
  constexpr auto prefix = std::string_view("-get").size();
  const auto meant = bare(text);
  const auto* const found = std::ranges::find_if(
      settings, [&](const auto& row) { return bare(row.name) == meant || row.getter.substr(prefix) == meant; });
  return found == std::end(settings) ? nullptr : found;
}

}  // namespace tavisk::control
