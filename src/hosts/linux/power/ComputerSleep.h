// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/shared/SettingChange.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// When the machine sleeps, by the login service that lets it sleep and answers its power button
/// (systemd-logind.service(8)), and by the tool's drop-in for it (logind.conf(5)). Its settings refer to the object.
class ComputerSleep {
 public:
  explicit ComputerSleep(const LinuxMachine& machine) : _machine(machine), _config(machine.root, "logind.conf") {}

  /// After how many minutes it sleeps when it is idle.
  Setting<Minutes> computerSleep();
  /// Whether the power button lets it sleep, instead of turning it off.
  Setting<bool> powerButtonSleep();

 private:
  Result<BusMessage> property(const char* name, const char* signature);
  Result<Minutes> liveMinutes();
  Result<bool> liveButton();
  Result<Minutes> storedMinutes() const;
  Result<bool> storedButton() const;
  Support sleepSupported();
  Support buttonSupported();
  std::string whatBlocksSleep();
  Result<void> store(const std::map<std::string, std::string>& values);
  Result<void> storeMinutes(Minutes asked);
  std::string whoUndoesMinutes();
  Result<void> restartService(Minutes asked);
  Result<void> applyButton();
  Result<void> rereadConfiguration();
  std::function<bool(bool)> onceButtonReads();

  LinuxMachine _machine;
  SystemdConfig _config;
};

}  // namespace tavisk
