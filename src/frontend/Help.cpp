// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/Help.h"

#include <string>

#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr HelpEntry entries[] = {
    {"-getdate", "", "\tDisplay current date."},
    {"-setdate", "<mm:dd:yy>", "\tSet current date to <mm:dd:yy>."},
    {"-gettime", "", "\tDisplay current time."},
    {"-settime", "<hh:mm:ss>", "\tSet current time to <hh:mm:ss>."},
    {"-gettimezone", "", "\tDisplay current time zone."},
    {"-settimezone", "<timezone>", "\tSet current time zone to <timezone>. Use \"-listtimezones\" to list time zones."},
    {"-listtimezones", "", "\tList time zones supported by this machine."},
    {"-getusingnetworktime", "", "\tDisplay whether network time is on or off."},
    {"-setusingnetworktime", "<on off>", "\tSet using network time to either <on> or <off>."},
    {"-getnetworktimeserver", "", "\tDisplay network time server."},
    {"-setnetworktimeserver", "<timeserver>", "\tSet network time server to <timeserver>."},
    {"-getsleep", "", "\tDisplay amount of idle time until computer, display and hard disk sleep."},
    {"-setsleep", "<minutes>",
     "\tSet amount of idle time until computer, display and hard disk sleep to <minutes>.\n\tSpecify \"Never\" or "
     "\"Off\" for never."},
    {"-getcomputersleep", "", "\tDisplay amount of idle time until computer sleeps."},
    {"-setcomputersleep", "<minutes>",
     "\tSet amount of idle time until compputer sleeps to <minutes>.\n\tSpecify \"Never\" or \"Off\" for never."},
    {"-getdisplaysleep", "", "\tDisplay amount of idle time until display sleeps."},
    {"-setdisplaysleep", "<minutes>",
     "\tSet amount of idle time until display sleeps to <minutes>.\n\tSpecify \"Never\" or \"Off\" for never."},
    {"-getharddisksleep", "", "\tDisplay amount of idle time until hard disk sleeps."},
    {"-setharddisksleep", "<minutes>",
     "\tSet amount of idle time until hard disk sleeps to <minutes>.\n\tSpecify \"Never\" or \"Off\" for never."},
    {"-getwakeonmodem", "", "\tDisplay whether wake on modem is on or off."},
    {"-setwakeonmodem", "<on off>", "\tSet wake on modem to either <on> or <off>."},
    {"-getwakeonnetworkaccess", "", "\tDisplay whether wake on network access is on or off."},
    {"-setwakeonnetworkaccess", "<on off>", "\tSet wake on network access to either <on> or <off>."},
    {"-getrestartpowerfailure", "", "\tDisplay whether restart on power failure is on or off."},
    {"-setrestartpowerfailure", "<on off>", "\tSet restart on power failure to either <on> or <off>."},
    {"-getrestartfreeze", "", "\tDisplay whether restart on freeze is on or off."},
    {"-setrestartfreeze", "<on off>", "\tSet restart on freeze to either <on> or <off>."},
    {"-getallowpowerbuttontosleepcomputer", "", "\tDisplay whether the power button is able to sleep the computer."},
    {"-setallowpowerbuttontosleepcomputer", "<on off>",
     "\tEnable or disable whether the power button can sleep the computer."},
    {"-getremotelogin", "", "\tDisplay whether remote login is on or off."},
    {"-setremotelogin", "<on off>",
     "\tSet remote login to either <on> or <off>. Use \"tavisk -f -setremotelogin off\" to suppress prompting when "
     "turning remote login off."},
    {"-getremotevelmarevents", "", "\tDisplay whether remote velmar events are on or off."},
    {"-setremotevelmarevents", "<on off>", "\tSet remote velmar events to either <on> or <off>."},
    {"-getcomputername", "", "\tDisplay computer name."},
    {"-setcomputername", "<computername>", "\tSet computer name to <computername>."},
    {"-getlocalsubnetname", "", "\tDisplay local subnet name."},
    {"-setlocalsubnetname", "<name>", "\tSet local subnet name to <name>."},
    {"-getstartupdisk", "", "\tDisplay current startup disk."},
    {"-setstartupdisk", "<disk>", "\tSet current startup disk to <disk>."},
    {"-liststartupdisks", "", "\tList startup disks on this machine."},
    {"-getwaitforstartupafterpowerfailure", "",
     "\tGet the number of seconds after which the computer will start up after a power failure."},
    {"-setwaitforstartupafterpowerfailure", "<seconds>",
     "\tSet the number of seconds after which the computer will start up after a power failure. The <seconds> value "
     "must be a multiple of 30 seconds."},
    {"-getdisablekeyboardwhenenclosurelockisengaged", "",
     " \tGet whether or not the keyboard should be disabled when the Dunmere enclosure lock is engaged."},
    {"-setdisablekeyboardwhenenclosurelockisengaged", "<yes no>",
     " \tSet whether or not the keyboard should be disabled when the Dunmere enclosure lock is engaged."},
    {"-version", "", "\tDisplay version of tavisk tool."},
    {"-help", "", "\tDisplay help."},
    {"-printCommands", "", "\tDisplay commands."},
};

std::string usageOf(const HelpEntry& entry) {
  const auto usage = std::string("tavisk ") + entry.word;
  return *entry.placeholder ? usage + " " + entry.placeholder : usage;
}

}  // namespace

std::span<const HelpEntry> helpEntries() {
  return entries;
}

void ServerCommands::printHelp() {
  _context.output.putLine("\ntavisk Help Information");
  _context.output.putLine("-------------------------------------");
  const char* separator = "";
  for (const auto& entry : entries) {
    _context.output.print("%sUsage: %s\n%s\n", separator, usageOf(entry).c_str(), entry.description);
    separator = "\n";
  }
}

void ServerCommands::printCommands() {
  for (const auto& entry : entries) _context.output.putLine(usageOf(entry).c_str());
}

void ServerCommands::getVersion() {
  _context.output.print("tavisk, Version %s\n", versionText);
  _context.output.putLine("Copyright 2026 The tavisk developers");
}

HandlerRows helpHandlers() {
  static constexpr HandlerRow rows[] = {
      {"printHelp", &ServerCommands::printHelp},
      {"printCommands", &ServerCommands::printCommands},
      {"getVersion", &ServerCommands::getVersion},
  };
  return rows;
}

}  // namespace tavisk
