// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// The service that puts an idle machine to sleep and answers its power button (systemd-logind.service(8)), and the
/// tool's drop-in for it (logind.conf(5)). Its settings refer to the object.
class LoginService {
 public:
  explicit LoginService(const LinuxMachine& machine) : _machine(machine), _config(machine.root, "logind.conf") {}

  /// After how many minutes an idle machine sleeps, to be read; and to be changed.
  Setting<std::string> computerSleep();
  Setting<std::string> computerSleepChange(const std::string& minutes);
  /// Whether the power button lets it sleep, instead of turning it off.
  Setting<std::string> powerButtonSleep();
  Setting<std::string> powerButtonSleepChange();

 private:
  using Value = std::optional<std::string>;

  Result<BusMessage> property(const char* name, const char* signature);
  Result<Value> liveSleep();
  Result<Value> liveButton();
  Value storedSleep() const;
  Value storedButton() const;
  std::optional<Failure> whyCannotSleep();
  std::optional<Failure> whyNoButton();
  std::string whatBlocksSleep();
  Result<void> store(const std::map<std::string, std::string>& values);
  Result<void> restartService(const std::string& minutes);
  Result<void> rereadConfiguration();
  std::function<bool(const std::string&)> onceItReads(Setting<std::string>::Read live);

  LinuxMachine _machine;
  SystemdConfig _config;
};

}  // namespace tavisk
