// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ProcessUtilities.h"
#include "platform/linux/EnclosureLock.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/LinuxPreferencesStore.h"

namespace tavisk {

/// The processes in /proc, the keyboards and the lock of the enclosure.
class LinuxProcessUtilities final : public ProcessUtilities {
 public:
  /// The last two must outlive the object.
  LinuxProcessUtilities(const LinuxMachine& machine, LinuxPreferencesStore& preferences,
                        ManagementController& controller)
      : _machine(machine), _preferences(preferences), _lock(machine, controller) {}

  /// The one with the smallest id.
  ProcessId processNamed(const std::string& name) override;
  /// Only to a process that has an id of its own, never to a group or to all.
  void sendSignal(int signal, ProcessId process) override;
  void setLockEnclosureState(bool disablesKeyboard) override { _lock.setDisablesKeyboard(disablesKeyboard); }
  void setMachineBoolean(const std::string& key, bool value) override { _preferences.setBoolean(key, value); }
  void writeMachinePreferences() override { _preferences.writeOut(); }

 private:
  Result<void> signalProcess(int signal, ProcessId process) const;

  LinuxMachine _machine;
  LinuxPreferencesStore& _preferences;
  EnclosureLock _lock;
};

}  // namespace tavisk
