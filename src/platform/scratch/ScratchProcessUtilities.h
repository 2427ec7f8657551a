// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ProcessUtilities.h"
#include "platform/scratch/MachineSettings.h"
#include "platform/scratch/ScratchPreferencesStore.h"

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

}  // namespace tavisk
