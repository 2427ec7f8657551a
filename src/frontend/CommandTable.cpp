// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/CommandTable.h"

#include <utility>

#include "base/PropertyList.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::string_view tableText = R"(<dict>
<key>-help</key><dict><key>selector</key><string>printHelp</string><key>arguments</key><integer>0</integer></dict>
<key>-getdate</key><dict><key>selector</key><string>getDate</string><key>arguments</key><integer>0</integer></dict>
<key>-setdate</key><dict><key>selector</key><string>setDate:</string><key>arguments</key><integer>1</integer></dict>
<key>-gettime</key><dict><key>selector</key><string>getTime</string><key>arguments</key><integer>0</integer></dict>
<key>-settime</key><dict><key>selector</key><string>setTime:</string><key>arguments</key><integer>1</integer></dict>
<key>-gettimezone</key><dict><key>selector</key><string>getTimeZone</string><key>arguments</key><integer>0</integer></dict>
<key>-settimezone</key><dict><key>selector</key><string>setTimeZone:</string><key>arguments</key><integer>1</integer></dict>
<key>-listtimezones</key><dict><key>selector</key><string>listTimeZones</string><key>arguments</key><integer>0</integer></dict>
<key>-getusingnetworktime</key><dict><key>selector</key><string>getUsingNetworkTime</string><key>arguments</key><integer>0</integer></dict>
<key>-setusingnetworktime</key><dict><key>selector</key><string>setUsingNetworkTime:</string><key>arguments</key><integer>1</integer></dict>
<key>-getnetworktimeserver</key><dict><key>selector</key><string>getNetworkTimeServer</string><key>arguments</key><integer>0</integer></dict>
<key>-setnetworktimeserver</key><dict><key>selector</key><string>setNetworkTimeServer:</string><key>arguments</key><integer>1</integer></dict>
<key>-getsleep</key><dict><key>selector</key><string>getSleep</string><key>arguments</key><integer>0</integer></dict>
<key>-setsleep</key><dict><key>selector</key><string>setSleep:</string><key>arguments</key><integer>1</integer></dict>
<key>-getcomputersleep</key><dict><key>selector</key><string>getComputerSleep</string><key>arguments</key><integer>0</integer></dict>
<key>-setcomputersleep</key><dict><key>selector</key><string>setComputerSleep:</string><key>arguments</key><integer>1</integer></dict>
<key>-getdisplaysleep</key><dict><key>selector</key><string>getDisplaySleep</string><key>arguments</key><integer>0</integer></dict>
<key>-setdisplaysleep</key><dict><key>selector</key><string>setDisplaySleep:</string><key>arguments</key><integer>1</integer></dict>
<key>-getharddisksleep</key><dict><key>selector</key><string>getHardDiskSleep</string><key>arguments</key><integer>0</integer></dict>
<key>-setharddisksleep</key><dict><key>selector</key><string>setHardDiskSleep:</string><key>arguments</key><integer>1</integer></dict>
<key>-getwakeonmodem</key><dict><key>selector</key><string>getWakeOnModem</string><key>arguments</key><integer>0</integer></dict>
<key>-setwakeonmodem</key><dict><key>selector</key><string>setWakeOnModem:</string><key>arguments</key><integer>1</integer></dict>
<key>-getwakeonnetworkaccess</key><dict><key>selector</key><string>getWakeOnNetworkAccess</string><key>arguments</key><integer>0</integer></dict>
<key>-setwakeonnetworkaccess</key><dict><key>selector</key><string>setWakeOnNetworkAccess:</string><key>arguments</key><integer>1</integer></dict>
<key>-getrestartpowerfailure</key><dict><key>selector</key><string>getRestartPowerFailure</string><key>arguments</key><integer>0</integer></dict>
<key>-setrestartpowerfailure</key><dict><key>selector</key><string>setRestartPowerFailure:</string><key>arguments</key><integer>1</integer></dict>
<key>-getrestartfreeze</key><dict><key>selector</key><string>getRestartFreeze</string><key>arguments</key><integer>0</integer></dict>
<key>-setrestartfreeze</key><dict><key>selector</key><string>setRestartFreeze:</string><key>arguments</key><integer>1</integer></dict>
<key>-getallowpowerbuttontosleepcomputer</key><dict><key>selector</key><string>getAllowPowerButtonToSleepComputer</string><key>arguments</key><integer>0</integer></dict>
<key>-setallowpowerbuttontosleepcomputer</key><dict><key>selector</key><string>setAllowPowerButtonToSleepComputer:</string><key>arguments</key><integer>1</integer></dict>
<key>-getremotelogin</key><dict><key>selector</key><string>getRemoteLogin</string><key>arguments</key><integer>0</integer></dict>
<key>-setremotelogin</key><dict><key>selector</key><string>setRemoteLogin:</string><key>arguments</key><integer>1</integer></dict>
<key>-getremotevelmarevents</key><dict><key>selector</key><string>getRemoteVelmarEvents</string><key>arguments</key><integer>0</integer></dict>
<key>-setremotevelmarevents</key><dict><key>selector</key><string>setRemoteVelmarEvents:</string><key>arguments</key><integer>1</integer></dict>
<key>-getcomputername</key><dict><key>selector</key><string>getComputerName</string><key>arguments</key><integer>0</integer></dict>
<key>-setcomputername</key><dict><key>selector</key><string>setComputerName:</string><key>arguments</key><integer>1</integer></dict>
<key>-getlocalsubnetname</key><dict><key>selector</key><string>getLocalSubnetName</string><key>arguments</key><integer>0</integer></dict>
<key>-setlocalsubnetname</key><dict><key>selector</key><string>setLocalSubnetName:</string><key>arguments</key><integer>1</integer></dict>
<key>-getstartupdisk</key><dict><key>selector</key><string>getStartupDisk</string><key>arguments</key><integer>0</integer></dict>
<key>-setstartupdisk</key><dict><key>selector</key><string>setStartupDisk:</string><key>arguments</key><integer>1</integer></dict>
<key>-liststartupdisks</key><dict><key>selector</key><string>listStartupDisk</string><key>arguments</key><integer>0</integer></dict>
<key>-getwaitforstartupafterpowerfailure</key><dict><key>selector</key><string>getWaitForStartupAfterPowerFailure</string><key>arguments</key><integer>0</integer></dict>
<key>-setwaitforstartupafterpowerfailure</key><dict><key>selector</key><string>setWaitForStartupAfterPowerFailure:</string><key>arguments</key><integer>1</integer></dict>
<key>-getdisablekeyboardwhenenclosurelockisengaged</key><dict><key>selector</key><string>getDisableKeyBoardWhenEnclosureLockIsEngaged</string><key>arguments</key><integer>0</integer></dict>
<key>-setdisablekeyboardwhenenclosurelockisengaged</key><dict><key>selector</key><string>setDisableKeyBoardWhenEnclosureLockIsEngaged:</string><key>arguments</key><integer>1</integer></dict>
<key>-getkernelbootarchitecturesetting</key><dict><key>selector</key><string>getKernelBootArchitectureSetting</string><key>arguments</key><integer>0</integer></dict>
<key>-setkernelbootarchitecture</key><dict><key>selector</key><string>setKernelBootArchitecture:</string><key>arguments</key><integer>1</integer></dict>
<key>-printcommands</key><dict><key>selector</key><string>printCommands</string><key>arguments</key><integer>0</integer></dict>
<key>-version</key><dict><key>selector</key><string>getVersion</string><key>arguments</key><integer>0</integer></dict>
</dict>
)";

Result<CommandTable::Entry> readEntry(const std::string& word, const PropertyList& value) {
  const auto* row = value.asDictionary();
  const auto* selector = row ? row->find("selector") : nullptr;
  const auto* arguments = row ? row->find("arguments") : nullptr;
  if (!selector || !selector->asString() || !arguments || !arguments->asInteger())
    return Failure{"read the command table", word, "a selector and an argument count are expected"};
  return CommandTable::Entry{*selector->asString(), *arguments->asInteger()};
}

}  // namespace

std::string_view CommandTable::text() {
  return tableText;
}

Result<CommandTable> CommandTable::parse(std::string_view xml) {
  const auto list = parsePropertyList(xml, ownFileLimits);
  if (!list) return list.failure();
  const auto* rows = list->asDictionary();
  if (!rows) return Failure{"read the command table", "its root", "a dictionary is expected"};

  CommandTable table;
  table._entries.reserve(rows->size());
  for (const auto& [word, value] : *rows) {
    auto entry = readEntry(word, value);
    if (!entry) return entry.failure();
    table._entries.emplace(word, std::move(entry).value());
  }
  return table;
}

const CommandTable::Entry* CommandTable::find(const std::string& word) const {
  const auto entry = _entries.find(word);
  return entry == _entries.end() ? nullptr : &entry->second;
}

const CommandTable::Entry* CommandTable::findTyped(const std::string& word) const {
  const auto key = lowerCased(word);
  return find(key.starts_with('-') ? key : "-" + key);
}

}  // namespace tavisk
