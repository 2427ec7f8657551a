// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <cstdint>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

/// What the setters differ in.
struct SleepTimerSetter {
  const char* command;
  const char* usage;
  const char* remark;  ///< follows the value in the confirmation
  std::span<const SleepTimer> timers;
};

namespace {

constexpr std::uint64_t longestSleep = 180;
constexpr std::int64_t notANumber = -1;

std::int64_t readMinutes(const std::string& value) {
  if (caseInsensitiveEqualTo(value, "Off") || caseInsensitiveEqualTo(value, "Never")) return 0;
  const std::int64_t minutes = leadingInteger(value);
  // Of all that reads as 0 only the plain digit is meant as such: not "00", not "0abc", not "soon".
  return minutes == 0 && value != "0" ? notANumber : minutes;
}

}  // namespace

std::string ServerCommands::getPMKey() {
  return "AC Power";
}

void ServerCommands::getSleep() {
  showSleepTimer("Sleep: Computer sleeps", SleepTimer::computer);
  showSleepTimer("Sleep: Display sleeps", SleepTimer::display);
  showSleepTimer("Sleep: Disk sleeps", SleepTimer::hardDisk);
}

void ServerCommands::getComputerSleep() {
  showSleepTimer("Computer Sleep:", SleepTimer::computer);
}

void ServerCommands::getDisplaySleep() {
  showSleepTimer("Display Sleep:", SleepTimer::display);
}

void ServerCommands::getHardDiskSleep() {
  showSleepTimer("Hard Disk Sleep:", SleepTimer::hardDisk);
}

void ServerCommands::showSleepTimer(const char* label, SleepTimer timer) {
  const Minutes minutes = _context.host.powerSettings().untilSleep(timer, {getPMKey()});
  if (minutes.count != 0) {
    _context.output.print("%s after %lu minutes\n", label, minutes.count);
  } else {
    _context.output.print("%s Never\n", label);
  }
  setError(false);
}

void ServerCommands::setSleep(const std::string& minutes) {
  static constexpr SleepTimer all[] = {SleepTimer::display, SleepTimer::hardDisk, SleepTimer::computer};
  setSleepTimers({"setsleep", "setsleep <minutes>", " (computer, display, hard disk)", all}, minutes);
}

void ServerCommands::setComputerSleep(const std::string& minutes) {
  static constexpr SleepTimer system[] = {SleepTimer::computer};
  setSleepTimers({"setcomputersleep", "setcomputersleep <minutes>", "", system}, minutes);
}

void ServerCommands::setDisplaySleep(const std::string& minutes) {
  static constexpr SleepTimer display[] = {SleepTimer::display};
  setSleepTimers({"setdisplaysleep", "setdisplaysleep <minutes>", "", display}, minutes);
}

void ServerCommands::setHardDiskSleep(const std::string& minutes) {
  static constexpr SleepTimer disk[] = {SleepTimer::hardDisk};
  setSleepTimers({"setharddisksleep", "setharddisksleep <minutes>", "", disk}, minutes);
}

void ServerCommands::setSleepTimers(const SleepTimerSetter& setter, const std::string& value) {
  PowerSettingsService& power = _context.host.powerSettings();
  setError(false);
  if (checkForEmptyString(value, setter.command, "a value in minutes", setter.usage)) return;
  // Also what is below 0 is above the limit.
  const auto minutes = static_cast<std::uint64_t>(readMinutes(value));
  if (minutes > longestSleep) {
    _context.output.print(
        "%s: Error, %s is not a valid amount of time. The time specified must be between 0 and 180 minutes.\n",
        setter.command, value.c_str());
    setError(true);
    return;
  }
  for (const SleepTimer timer : setter.timers) power.setUntilSleep(timer, {getPMKey()}, {minutes});
  _context.output.print("%s: %s%s\n", setter.command, minutes == 0 ? "Never" : value.c_str(), setter.remark);
}

HandlerRows sleepTimersHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getSleep", &ServerCommands::getSleep},
      {"setSleep:", &ServerCommands::setSleep},
      {"getComputerSleep", &ServerCommands::getComputerSleep},
      {"setComputerSleep:", &ServerCommands::setComputerSleep},
      {"getDisplaySleep", &ServerCommands::getDisplaySleep},
      {"setDisplaySleep:", &ServerCommands::setDisplaySleep},
      {"getHardDiskSleep", &ServerCommands::getHardDiskSleep},
      {"setHardDiskSleep:", &ServerCommands::setHardDiskSleep},
  };
  return rows;
}

}  // namespace tavisk
