// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/PreferencesStore.h"
#include "platform/ProcessUtilities.h"
#include "platform/SettingNames.h"
#include "platform/linux/Unbuilt.h"

namespace tavisk {

class UnbuiltPreferences final : public PreferencesStore {
 public:
  explicit UnbuiltPreferences(EffectSink& effects) : _effects(effects) {}

  std::optional<PropertyList> value(const std::string& /*key*/) override {
    recordUnbuiltRead(_effects, setting::keyboardLockPreference);
    return std::nullopt;
  }

 private:
  EffectSink& _effects;
};

class UnbuiltProcesses final : public ProcessUtilities {
 public:
  explicit UnbuiltProcesses(EffectSink& effects) : _effects(effects) {}

  ProcessId processNamed(const std::string& /*name*/) override { return 0; }
  void sendSignal(int signal, ProcessId /*process*/) override {
    recordUnbuiltChange(_effects, setting::signalToProcess, std::to_string(signal));
  }
  void setLockEnclosureState(bool disablesKeyboard) override {
    recordUnbuiltChange(_effects, setting::keyboardLock, disablesKeyboard ? "on" : "off");
  }
  void setMachineBoolean(const std::string& /*key*/, bool value) override {
    recordUnbuiltChange(_effects, setting::keyboardLockPreference, value ? "on" : "off");
  }
  void writeMachinePreferences() override { recordUnbuiltChange(_effects, setting::preferencesWrite, "write"); }

 private:
  EffectSink& _effects;
};

}  // namespace tavisk
