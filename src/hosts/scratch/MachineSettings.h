// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <type_traits>

#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/scratch/MachineFile.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SettingReset.h"

namespace tavisk {

/// A setting as the machine file keeps it.
template <typename SettingValueType>
struct MachineSetting {
  using Value = SettingValueType;
  using Found = typename Setting<Value>::Found;  ///< absent: the setting has no value
  using Read = std::function<Found(MachineFile& machine)>;
  using Write = std::function<void(MachineFile::Dictionary& machine, const Value& value)>;

  std::string name;  ///< one of effects/SettingNames.h
  std::string unit;  ///< see SettingValue
  Read read;         ///< empty: nothing can be read
  Write write;       ///< empty: it is only read
};

/// One key as a setting; a text is absent where it has neither value nor default.
MachineSetting<bool> switchAt(std::string name, const std::string& section, const std::string& key);
MachineSetting<std::string> textAt(std::string name, const std::string& section, const std::string& key);
/// What is only done and counted, under a key which may be at the top; its effects call it by the word that is asked.
MachineSetting<std::string> countAt(std::string name, const std::string& section, const std::string& key);

/// What a machine file has of a setting apart from its default.
struct MachineOwn {
  std::function<bool(MachineFile& machine)> isThere;
  MachineFile::Edit removal;
};
/// One key of a dictionary at the top.
MachineOwn ownAt(const std::string& section, const std::string& key);

/// The reason in "Refusals" by which a machine fails as another one has. Where that was such a machine it is the same
/// reason; else it says what failed where.
std::string refusalTelling(const Failure& failure);

/// Adds one to a count.
void countUp(MachineFile::Dictionary& dictionary, std::string_view key);

/// Reads and changes the settings of the machine, and tells the effects. The one place that heeds "Refusals".
class MachineSettings {
 public:
  MachineSettings(MachineFile& file, EffectSink& effects, RunLoop& runLoop, Conduct conduct = Conduct::change)
      : _file(file), _effects(effects), _runLoop(runLoop), _conduct(conduct) {}

  /// What is no setting is read here: no refusal applies and no effect is told.
  MachineSection section(std::string_view name) { return _file.section(name); }

  /// Absent when reading is refused, or there is no value.
  template <typename Value>
  std::optional<Value> read(const MachineSetting<Value>& setting) {
    return observe(parts(setting));
  }
  bool isOn(const MachineSetting<bool>& setting) { return read(setting).value_or(false); }
  /// Writes also when the machine has the value already.
  template <typename Value>
  Effect change(const MachineSetting<Value>& setting, const std::type_identity_t<Value>& asked) {
    return carryOut(parts(setting), asked);
  }
  /// As reset(): the machine goes by its default again.
  template <typename Value>
  Effect reset(const MachineSetting<Value>& setting, const MachineOwn& own) {
    auto resettable = parts(setting);
    resettable.own = ownPart(own);
    return reset(resettable);
  }
  /// That a setting was to be changed which the machine cannot have.
  void recordUnsupported(const std::string& setting);
  /// The same of one that was to be read.
  void observeUnsupported(const std::string& setting);
  /// Writes what is no setting of the machine but the run's own doing: only a failure is an effect, and "*" does not
  /// refuse it.
  void note(const MachineSetting<bool>& setting, bool asked);

  /// As read() and change(), for a setting that the machine keeps outside its file, or changes in a way of its own.
  template <typename Value>
  std::optional<Value> observe(const Setting<Value>& setting) {
    return tavisk::observe(heedingRefusals(setting), _effects);
  }
  template <typename Value>
  Effect carryOut(const Setting<Value>& setting, const std::type_identity_t<Value>& asked) {
    const auto heeding = heedingRefusals(setting);
    if (_conduct == Conduct::forecast) return tavisk::foretell(heeding, asked, _effects);
    return tavisk::carryOut(heeding, asked, _effects, _runLoop);
  }
  template <typename Value>
  Effect reset(const Setting<Value>& setting) {
    return tavisk::reset(heedingRefusals(setting), _effects, _runLoop, _conduct);
  }
  /// What is given must outlive the parts.
  template <typename Value>
  Setting<Value> parts(const MachineSetting<Value>& setting);

 private:
  OwnPart ownPart(const MachineOwn& own);
  template <typename Value>
  Setting<Value> heedingRefusals(Setting<Value> setting);
  /// Why the setting is not set, or not read.
  std::optional<Failure> refusedChange(const std::string& setting);
  std::optional<Failure> refusedRead(const std::string& setting);
  std::optional<std::string> refusalNamed(const std::string& name);

  MachineFile& _file;
  EffectSink& _effects;
  RunLoop& _runLoop;
  Conduct _conduct;
};

template <typename Value>
Setting<Value> MachineSettings::parts(const MachineSetting<Value>& setting) {
  Setting<Value> parts;
  parts.name = setting.name;
  parts.unit = setting.unit;
  parts.where = _file.path();
  if (setting.read) parts.live = parts.stored = [this, &setting] { return setting.read(_file); };
  parts.store = [this, &setting](const Value& value) {
    return _file.change([&](MachineFile::Dictionary& machine) { setting.write(machine, value); });
  };
  parts.always = true;
  return parts;
}

template <typename Value>
Setting<Value> MachineSettings::heedingRefusals(Setting<Value> setting) {
  if (const auto refused = refusedRead(setting.name)) {
    for (auto* read : {&setting.live, &setting.stored})
      if (*read) *read = [=] { return *refused; };
  }
  if (const auto refused = refusedChange(setting.name)) {
    setting.check = [=](const Value&) { return *refused; };
    setting.own.check = [=] { return *refused; };
  }
  return setting;
}

}  // namespace tavisk
