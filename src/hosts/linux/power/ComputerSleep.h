// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/shared/SettingChange.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// When the machine sleeps, by the login service that lets it sleep and answers its power button
/// (systemd-logind.service(8)), and by the tool's drop-in for it (logind.conf(5)). Its settings refer to the object.
class ComputerSleep {
 public:
  explicit ComputerSleep(const LinuxMachine& machine)
      : _machine(machine), _config(machine.root, "logind.conf"), _ownFile(machine.root, _config.ownDropIn()) {}

  /// After how many minutes it sleeps when it is idle.
  Setting<Minutes> computerSleep();
  /// Whether the power button lets it sleep, instead of turning it off.
  Setting<bool> powerButtonSleep();

 private:
  using Question = std::function<Result<BusMessage>(Bus& bus)>;
  /// Of the login service. Another run may just be restarting it: it is asked again until it is back.
  Result<BusMessage> ask(const Question& question);
  Result<BusMessage> property(const char* name, const char* signature);
  Result<Minutes> liveMinutes();
  Result<bool> liveButton();
  /// By all files, and by the tool's own alone, where it says something.
  Result<Minutes> storedMinutes() const;
  Result<std::optional<Minutes>> ownMinutes() const;
  Result<bool> storedButton() const;
  Result<std::optional<bool>> ownButton() const;
  Support sleepSupported();
  Support supportWithoutAnswer(const Failure& failure);
  Support buttonSupported();
  std::string whatBlocksSleep();
  /// The file that says otherwise; empty: none does.
  std::string whatHidesMinutes(Minutes asked) const;
  std::string whatHidesButton(bool sleeps) const;
  Result<void> store(const std::map<std::string, std::string>& values, const std::function<Result<bool>()>& isHeeded,
                     const std::function<std::string()>& hidingFile);
  /// These keys of the own drop-in.
  OwnPart ownPart(const std::vector<std::string>& keys) const;
  Result<void> storeMinutes(Minutes asked);
  Result<void> storeButton(bool sleeps);
  std::string whoUndoesMinutes(Minutes asked);
  Result<void> restartService(Minutes asked);
  Result<void> applyButton();
  Result<void> rereadConfiguration();
  std::function<bool(bool)> onceButtonReads();

  LinuxMachine _machine;
  SystemdConfig _config;
  OwnFile _ownFile;
};

}  // namespace tavisk
