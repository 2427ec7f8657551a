// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/PreferencesStore.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Preferences".
class ScratchPreferencesStore final : public PreferencesStore {
 public:
  explicit ScratchPreferencesStore(MachineSettings& settings) : _settings(settings) {}

  std::optional<PropertyList> value(const std::string& key) override;
  void setBoolean(const std::string& key, bool value);
  /// Counts it.
  void writeOut();

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
