// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/ManagementController.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The folders in /sys of the keyboards that stand at the machine, or are plugged into it. The one that a management
/// controller pretends to be, for who sits elsewhere, is none.
Result<std::vector<std::string>> keyboards(const SystemRoot& root);

/// Whether the kernel passes on nothing of what is typed there (Documentation/input/input-programming.rst).
Result<bool> isInhibited(const SystemRoot& root, const std::string& keyboard);
Result<void> setInhibited(const SystemRoot& root, const std::string& keyboard, bool inhibited);

/// The lock of the enclosure's front panel, of which the management controller tells (IPMI 2.0, 28.1 and 28.2), and the
/// keyboards that it disables.
class EnclosureLock {
 public:
  /// The controller must outlive the object.
  EnclosureLock(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  /// Looks at the lock once. Keyboards are disabled if it is engaged and they are to be disabled then, else enabled.
  /// Gives back what was told.
  Effect setDisablesKeyboard(bool disables, const MachineHold& held);
  /// Tells whether they are disabled now to whoever keeps values.
  void tellKeyboards();

 private:
  Result<bool> isEngaged();

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
