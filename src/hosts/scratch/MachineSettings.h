// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/scratch/MachineFile.h"
#include "hosts/shared/SettingChange.h"

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

/// One key as a setting: a boolean reads as "on" or "off", and a text as absent where it has neither value nor default.
MachineSetting switchAt(std::string name, const std::string& section, const std::string& key);
MachineSetting textAt(std::string name, const std::string& section, const std::string& key);

/// Adds one to a count, which may be at the top.
void countUp(MachineFile::Dictionary& dictionary, std::string_view key);
void countUp(MachineFile::Dictionary& machine, std::string_view section, std::string_view key);

/// Reads and changes the settings of the machine, and tells the effects. The one place that heeds "Refusals".
class MachineSettings {
 public:
  MachineSettings(MachineFile& file, EffectSink& effects, RunLoop& runLoop)
      : _file(file), _effects(effects), _runLoop(runLoop) {}

  /// What is no setting is read here: no refusal applies and no effect is told.
  MachineSection section(std::string_view name) { return _file.section(name); }

  /// Absent when reading is refused, or there is no value.
  std::optional<std::string> read(const MachineSetting& setting);
  bool isOn(const MachineSetting& setting) { return read(setting) == "on"; }
  /// Writes also when the machine has the value already.
  Effect change(const MachineSetting& setting, const std::string& asked);
  void turn(const MachineSetting& setting, bool on) { change(setting, on ? "on" : "off"); }
  /// That a setting was to be changed which the machine cannot have.
  void recordUnsupported(const std::string& setting);
  /// Writes what is no setting of the machine but the run's own doing: only a failure is an effect, and "*" does not
  /// refuse it.
  void note(const MachineSetting& setting, const std::string& asked);

  /// The same for a setting that the machine keeps outside its file.
  std::optional<std::string> observe(Setting<std::string> setting);
  Effect carryOut(Setting<std::string> setting, const std::string& asked);

 private:
  Setting<std::string> parts(const MachineSetting& setting);
  Result<void> write(const MachineSetting& setting, const std::string& value);
  Setting<std::string> heedingRefusals(Setting<std::string> setting);
  std::optional<std::string> refusal(const std::string& setting, const char* suffix);
  std::optional<std::string> refusalNamed(const std::string& name);

  MachineFile& _file;
  EffectSink& _effects;
  RunLoop& _runLoop;
};

}  // namespace tavisk
