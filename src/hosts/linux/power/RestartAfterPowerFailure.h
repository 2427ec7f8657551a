// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/FirmwareAttribute.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/ManagementController.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Whether the machine starts again when power comes back: the power restore policy of its management controller, else
/// a setting of its firmware. Both keep it themselves.
class RestartAfterPowerFailure {
 public:
  RestartAfterPowerFailure(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  /// To be read, and to be changed.
  Setting<std::string> restartAfterPowerFailure();

 private:
  /// Which policies the controller knows, as bits in one byte; a failure when it has none to choose from.
  ControllerAnswer policies();
  Result<bool> controllerRestarts();
  Result<void> setController(bool restarts);
  Setting<std::string> ofController();
  Setting<std::string> ofFirmware(const FirmwareAttribute& attribute);

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
