// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <cstdint>
#include <span>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr std::uint64_t longestSleep = 180;
constexpr std::int64_t notANumber = -1;

/// What the setters differ in.
struct SleepTimerSetter {
  const char* command;
  const char* usage;
  const char* remark;  ///< follows the value in the confirmation
  std::span<const SleepTimer> timers;
};

void showSleepTimer(ServerCommands& commands, const char* label, SleepTimer timer) {
  const auto& context = commands.context();
  const auto minutes = context.host.powerSettings().untilSleep(timer, {ServerCommands::getPMKey()});
  if (minutes.count != 0) {
    context.output.print("%s after %lu minutes\n", label, minutes.count);
  } else {
    context.output.print("%s Never\n", label);
  }
  commands.setError(false);
}

std::int64_t readMinutes(const std::string& value) {
  if (caseInsensitiveEqualTo(value, "Off") || caseInsensitiveEqualTo(value, "Never")) return 0;
  const auto minutes = leadingInteger(value);
  // Of all that reads as 0 only the plain digit is meant as such: not "00", not "0abc", not "soon".
  return minutes == 0 && value != "0" ? notANumber : minutes;
}

void setSleepTimers(ServerCommands& commands, const SleepTimerSetter& setter, const std::string& value) {
  const auto& context = commands.context();
  auto& power = context.host.powerSettings();
  commands.setError(false);
  if (commands.checkForEmptyString(value, setter.command, "a value in minutes", setter.usage)) return;
  // Also what is below 0 is above the limit.
  const auto minutes = static_cast<std::uint64_t>(readMinutes(value));
  if (minutes > longestSleep) {
    context.output.print(
        "%s: Error, %s is not a valid amount of time. The time specified must be between 0 and 180 minutes.\n",
        setter.command, value.c_str());
    commands.refuse("a number of minutes from 0 to 180, 'Never' or 'Off'");
    commands.setError(true);
    return;
  }
  for (const auto timer : setter.timers) power.setUntilSleep(timer, {ServerCommands::getPMKey()}, {minutes});
  context.output.print("%s: %s%s\n", setter.command, minutes == 0 ? "Never" : value.c_str(), setter.remark);
}

}  // namespace

std::string ServerCommands::getPMKey() {
  return "AC Power";
}

void ServerCommands::getSleep() {
  showSleepTimer(*this, "Sleep: Computer sleeps", SleepTimer::computer);
  showSleepTimer(*this, "Sleep: Display sleeps", SleepTimer::display);
  showSleepTimer(*this, "Sleep: Disk sleeps", SleepTimer::hardDisk);
}

void ServerCommands::getComputerSleep() {
  showSleepTimer(*this, "Computer Sleep:", SleepTimer::computer);
}

void ServerCommands::getDisplaySleep() {
  showSleepTimer(*this, "Display Sleep:", SleepTimer::display);
}

void ServerCommands::getHardDiskSleep() {
  showSleepTimer(*this, "Hard Disk Sleep:", SleepTimer::hardDisk);
}

void ServerCommands::setSleep(const std::string& minutes) {
  static constexpr SleepTimer all[] = {SleepTimer::display, SleepTimer::hardDisk, SleepTimer::computer};
  setSleepTimers(*this, {"setsleep", "setsleep <minutes>", " (computer, display, hard disk)", all}, minutes);
}

void ServerCommands::setComputerSleep(const std::string& minutes) {
  static constexpr SleepTimer system[] = {SleepTimer::computer};
  setSleepTimers(*this, {"setcomputersleep", "setcomputersleep <minutes>", "", system}, minutes);
}

void ServerCommands::setDisplaySleep(const std::string& minutes) {
  static constexpr SleepTimer display[] = {SleepTimer::display};
  setSleepTimers(*this, {"setdisplaysleep", "setdisplaysleep <minutes>", "", display}, minutes);
}

void ServerCommands::setHardDiskSleep(const std::string& minutes) {
  static constexpr SleepTimer disk[] = {SleepTimer::hardDisk};
  setSleepTimers(*this, {"setharddisksleep", "setharddisksleep <minutes>", "", disk}, minutes);
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
