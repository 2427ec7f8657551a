// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/FileDescriptor.h"
#include "hosts/linux/machine/LinuxPreferences.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "platform/Processes.h"

namespace tavisk {

/// The processes in /proc; keyboards and preferences are changed through their store.
class LinuxProcessUtilities final : public ProcessUtilities {
 public:
  /// The preferences must outlive the object.
  LinuxProcessUtilities(const LinuxMachine& machine, LinuxPreferencesStore& preferences)
      : _machine(machine), _preferences(preferences) {}

  /// The one with the smallest id.
  ProcessId processNamed(const std::string& name) override;
  /// Only to a process that has an id of its own, never to a group or to all.
  void sendSignal(int signal, ProcessId process) override;
  void setLockEnclosureState(bool disablesKeyboard) override { _preferences.setDisablesKeyboard(disablesKeyboard); }
  void setMachineBoolean(const std::string& key, bool value) override { _preferences.setBoolean(key, value); }
  void writeMachinePreferences() override { _preferences.writeOut(); }

 private:
  Result<void> signalProcess(int signal, ProcessId process) const;

  LinuxMachine _machine;
  LinuxPreferencesStore& _preferences;
};

/// Asks the service of logins to delay a shutdown (its Inhibit() call, org.freedesktop.login1(5)). Where there is no
/// such service nothing waits; a call that fails is recorded, and nothing waits either.
class LinuxProcessTermination final : public ProcessTermination {
 public:
  explicit LinuxProcessTermination(const LinuxMachine& machine) : _machine(machine) {}

  void disable() override;
  void enable() override;

 private:
  /// For none where there is no such service.
  Result<FileDescriptor> delayShutdown();

  LinuxMachine _machine;
  FileDescriptor _hold;  ///< the delay lasts as long as it is open
  int _holds = 0;
};

class LinuxProgramRunner final : public ProgramRunner {
 public:
  explicit LinuxProgramRunner(const LinuxMachine& machine) : _machine(machine) {}

  Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) override;

 private:
  LinuxMachine _machine;
};

}  // namespace tavisk
