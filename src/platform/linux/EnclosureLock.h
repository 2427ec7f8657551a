// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/linux/LinuxMachine.h"
#include "platform/linux/power/ManagementController.h"

namespace tavisk {

/// The lock of the enclosure's front panel, of which the management controller tells (IPMI 2.0, 28.1 and 28.2), and the
/// keyboards that it disables.
class EnclosureLock {
 public:
  /// The controller must outlive the object.
  EnclosureLock(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  /// Looks at the lock once. Keyboards are disabled if it is engaged and they are to be disabled then, else enabled.
  void setDisablesKeyboard(bool disables);

 private:
  Result<bool> isEngaged();

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
