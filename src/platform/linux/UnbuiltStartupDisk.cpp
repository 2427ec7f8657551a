// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/UnbuiltStartupDisk.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

Failure notBuiltYet(const char* tried, const std::string& on) {
  return {tried, on, "not built yet"};
}

}  // namespace

void UnbuiltStartupDisk::schedule(RunLoop&) {
  _effects.recordFailure(setting::startupDisk, notBuiltYet("find disks", "this machine"));
}

BootSettings::BootPreference UnbuiltStartupDisk::bootPreference() {
  _effects.recordFailure(setting::startupDisk, notBuiltYet("read", "the boot preference"));
  return {notBuilt, std::nullopt};
}

ServiceStatus UnbuiltStartupDisk::setBootPreference(const BootChoice& choice) {
  _effects.recordFailure(setting::startupDisk, notBuiltYet("set", "the boot preference"), choice.disk.text);
  return notBuilt;
}

ServiceStatus UnbuiltStartupDisk::setFirmwareVariable(const std::string& name, const std::string& value) {
  _effects.recordFailure(setting::firmwareVariable + name, notBuiltYet("set", name), value);
  return notBuilt;
}

std::pair<RegistryStatus, RegistryEntry> UnbuiltStartupDisk::parent(const RegistryEntry& entry, RegistryPlane) {
  return {notBuilt, entry};
}

std::pair<RegistryStatus, std::string> UnbuiltStartupDisk::path(const RegistryEntry&, RegistryPlane) {
  return {notBuilt, ""};
}

Result<ProgramOutput> UnbuiltStartupDisk::run(const std::string& program, const std::vector<std::string>&) {
  return notBuiltYet("run", program);
}

}  // namespace tavisk
