// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/ServerCommands.h"

namespace tavisk {

std::string ServerCommands::getUPSKey() {
  return "AC Power";
}

void ServerCommands::listUPSSupportedShutdownOption() {}
std::nullopt_t ServerCommands::getUPSSHutDownOptionListHelper(const std::string& /*options*/) {
  return std::nullopt;
}
void ServerCommands::setUPSShutdownOption(const std::string& /*option*/, const std::string& /*value*/) {}
void ServerCommands::getUPSShutdownOption() {}
void ServerCommands::getUPSBatteryLevel() {}
void ServerCommands::getUPSModel() {}
void ServerCommands::getUPSSleep() {}
void ServerCommands::setUPSSleep(const std::string& /*minutes*/) {}
void ServerCommands::getUPSHardDiskSleep() {}
void ServerCommands::setUPSHardDiskSleep(const std::string& /*minutes*/) {}
void ServerCommands::getUPSDisplaySleep() {}
void ServerCommands::setUPSDisplaySleep(const std::string& /*minutes*/) {}
void ServerCommands::getUPSComputerSleep() {}
void ServerCommands::setUPSComputerSleep(const std::string& /*minutes*/) {}
void ServerCommands::listUPSProcessorPerformanceOptions() {}
void ServerCommands::setUPSProcessorPerformance(const std::string& /*performance*/) {}
void ServerCommands::getUPSProccessorPerformance() {}

void ServerCommands::setScheduledShutDownTime(const std::string& date, const std::string& andTime) {
  _context.host.systemLog().write("setScheduledShutDownTime: " + date + " " + andTime);
}

void ServerCommands::getScheduledShutDownTime() {
  _context.host.systemLog().write("getScheduledShutDownTime");
}

void ServerCommands::setScheduledStartupTime(const std::string& date, const std::string& andTime) {
  _context.host.systemLog().write("setScheduledStartupTime: " + date + "  " + andTime);
}

void ServerCommands::getScheduledStartupTime() {
  _context.host.systemLog().write("getScheduledStartupTime");
}

void ServerCommands::setScheduledWakeTime(const std::string& date, const std::string& andTime) {
  _context.host.systemLog().write("setScheduledWakeTime:  " + date + " " + andTime);
}

void ServerCommands::getScheduledWakeTime() {
  _context.host.systemLog().write("getScheduledWakeTime");
}

void ServerCommands::setScheduledSleepTime(const std::string& date, const std::string& andTime) {
  _context.host.systemLog().write("setScheduledSleepTime: " + date + " " + andTime);
}

void ServerCommands::getScheduledSleepTime() {
  _context.host.systemLog().write("getScheduledSleepTime");
}

}  // namespace tavisk
