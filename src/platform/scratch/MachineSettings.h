// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "platform/EffectSink.h"
#include "platform/RunLoop.h"
#include "platform/SettingChange.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// A setting as the machine file keeps it.
struct MachineSetting {
  using Value = Result<std::optional<std::string>>;  ///< absent: the setting has no value
  using Read = std::function<Value(MachineFile& machine)>;
  using Write = std::function<void(MachineFile::Dictionary& machine, const std::string& value)>;

  std::string name;  ///< one of platform/SettingNames.h
  std::string unit;  ///< see SettingValue
  Read read;         ///< empty: nothing can be read
  Write write;
};

/// One key as a setting: a boolean reads as "on" or "off".
MachineSetting switchAt(std::string name, const std::string& section, const std::string& key);
MachineSetting textAt(std::string name, const std::string& section, const std::string& key);

/// Adds one to a count.
void countUp(MachineFile::Dictionary& machine, std::string_view section, std::string_view key);

/// Reads and changes the settings of the machine, and tells the effects. The one place that heeds "Refusals".
class MachineSettings {
 public:
  MachineSettings(MachineFile& file, EffectSink& effects, RunLoop& runLoop)
      : _file(file), _effects(effects), _runLoop(runLoop) {}

  /// Absent when reading is refused, or there is no value.
  std::optional<std::string> read(const MachineSetting& setting);
  bool isOn(const MachineSetting& setting) { return read(setting) == "on"; }
  /// Writes also when the machine has the value already.
  void change(const MachineSetting& setting, const std::string& asked);
  void turn(const MachineSetting& setting, bool on) { change(setting, on ? "on" : "off"); }
  /// Writes what is no setting of the machine but the run's own doing: only a failure is an effect, and "*" does not
  /// refuse it.
  void note(const MachineSetting& setting, const std::string& asked);

 private:
  Setting parts(const MachineSetting& setting);
  MachineSetting::Value readUnlessRefused(const MachineSetting& setting);
  Result<void> write(const MachineSetting& setting, const std::string& value,
                     const std::optional<std::string>& refusal);
  std::optional<std::string> refusal(const std::string& setting, const char* suffix);
  std::optional<std::string> refusalNamed(const std::string& name);

  MachineFile& _file;
  EffectSink& _effects;
  RunLoop& _runLoop;
};

}  // namespace tavisk
