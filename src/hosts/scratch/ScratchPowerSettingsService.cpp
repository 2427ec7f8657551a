// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchPowerSettingsService.h"

#include <algorithm>
#include <cstdint>

#include "base/Text.h"
#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* sources = "Power Sources";

const char* keyOf(SleepTimer timer) {
  switch (timer) {
    case SleepTimer::computer:
      return "System Sleep";
    case SleepTimer::display:
      return "Display Sleep";
    case SleepTimer::hardDisk:
      break;
  }
  return "Disk Sleep";
}

const char* keyOf(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnModem:
      return "Wake On Ring";
    case PowerSwitch::wakeOnNetworkAccess:
      return "Wake On LAN";
    case PowerSwitch::restartAfterPowerFailure:
      return "Auto Restart";
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return "Power Button Sleep";
}

MachineSetting settingOf(SleepTimer timer, const PowerSource& source) {
  const auto* key = keyOf(timer);
  return {nameOf(timer), "minutes",
          [=](MachineFile& machine) -> MachineSetting::Value {
            return std::optional(std::to_string(machine.section(sources).section(source.name).integer(key)));
          },
          [=](MachineFile::Dictionary& machine, const std::string& value) {
            machine.dictionary(sources).dictionary(source.name).set(key, leadingInteger(value));
          }};
}

/// Absent when the machine does not support it.
MachineSetting settingOf(PowerSwitch which, const PowerSource& source) {
  const auto* key = keyOf(which);
  return {nameOf(which), "",
          [=](MachineFile& machine) -> MachineSetting::Value {
            const auto ofSource = machine.section(sources).section(source.name);
            const auto* value = ofSource.find(key);
            return value ? std::optional<std::string>(*value->asBoolean() ? "on" : "off") : std::nullopt;
          },
          [=](MachineFile::Dictionary& machine, const std::string& value) {
            machine.dictionary(sources).dictionary(source.name).set(key, value == "on");
          }};
}

MachineSetting restartAfterFreeze() {
  return switchAt(setting::restartAfterFreeze, "Power", "Restart On Hang");
}

}  // namespace

Minutes ScratchPowerSettingsService::untilSleep(SleepTimer timer, const PowerSource& source) {
  const auto minutes = leadingInteger(_settings.read(settingOf(timer, source)).value_or("0"));
  return {static_cast<unsigned long>(std::max<std::int64_t>(minutes, 0))};
}

void ScratchPowerSettingsService::setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) {
  _settings.change(settingOf(timer, source), std::to_string(minutes.count));
}

bool ScratchPowerSettingsService::supports(PowerSwitch which, const PowerSource& source) {
  return _settings.section(sources).section(source.name).find(keyOf(which)) != nullptr;
}

bool ScratchPowerSettingsService::canSet(PowerSwitch which, const PowerSource& source) {
  if (supports(which, source)) return true;
  _settings.recordUnsupported(nameOf(which));
  return false;
}

bool ScratchPowerSettingsService::isOn(PowerSwitch which, const PowerSource& source) {
  return _settings.isOn(settingOf(which, source));
}

void ScratchPowerSettingsService::setOn(PowerSwitch which, const PowerSource& source, bool on) {
  _settings.turn(settingOf(which, source), on);
}

bool ScratchPowerSettingsService::restartsAfterFreeze() {
  return _settings.isOn(restartAfterFreeze());
}

void ScratchPowerSettingsService::setRestartsAfterFreeze(bool restarts) {
  _settings.turn(restartAfterFreeze(), restarts);
}

}  // namespace tavisk
