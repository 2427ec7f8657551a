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
  /// The controller must outlive the object.
  RestartAfterPowerFailure(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  /// Asks the controller which of the two it is. Refers to the object.
  Setting<bool> restartAfterPowerFailure();

 private:
  /// Which policies the controller knows, as bits; a failure when it has none to choose from.
  Result<std::uint8_t> policies();
  Result<bool> controllerRestarts();
  Result<void> setController(bool restarts);
  Setting<bool> ofController();
  Setting<bool> ofFirmware(const FirmwareAttribute& attribute);

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
