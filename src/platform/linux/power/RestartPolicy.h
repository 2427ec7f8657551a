// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/power/FirmwareAttribute.h"
#include "platform/linux/power/ManagementController.h"

namespace tavisk {

/// Whether the machine starts again when power comes back: the power restore policy of its management controller, else
/// a setting of its firmware. Both keep it themselves.
class RestartPolicy {
 public:
  RestartPolicy(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  /// To be read, and to be changed.
  Setting restartAfterPowerFailure();

 private:
  /// Which policies the controller knows, as bits in one byte; a failure when it has none to choose from.
  ControllerAnswer policies();
  Result<bool> controllerRestarts();
  Result<void> setController(bool restarts);
  Setting ofController();
  Setting ofFirmware(const FirmwareAttribute& attribute);

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
