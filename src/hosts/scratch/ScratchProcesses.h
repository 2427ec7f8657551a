// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/MachineSettings.h"
#include "hosts/scratch/ScratchPreferences.h"
#include "platform/Processes.h"

namespace tavisk {

/// "Processes", "Signals" and "Enclosure Lock"; preferences are changed through their store.
class ScratchProcessUtilities final : public ProcessUtilities {
 public:
  ScratchProcessUtilities(MachineSettings& settings, ScratchPreferencesStore& preferences)
      : _settings(settings), _preferences(preferences) {}

  ProcessId processNamed(const std::string& name) override;
  void sendSignal(int signal, ProcessId process) override;
  void setLockEnclosureState(bool disablesKeyboard) override;
  void setMachineBoolean(const std::string& key, bool value) override { _preferences.setBoolean(key, value); }
  void writeMachinePreferences() override { _preferences.writeOut(); }

 private:
  MachineSettings& _settings;
  ScratchPreferencesStore& _preferences;
};

/// A machine that never shuts down.
class ScratchProcessTermination final : public ProcessTermination {
 public:
  void disable() override {}
  void enable() override {}
};

/// The only program of the machine is /usr/sbin/nvram, which prints a firmware variable.
class ScratchProgramRunner final : public ProgramRunner {
 public:
  explicit ScratchProgramRunner(MachineFile& machine) : _machine(machine) {}

  Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) override;

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
