// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchPowerSettingsService.h"

#include <cstdint>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* sources = "Power Sources";
constexpr const char* powerSection = "Power";
constexpr const char* restartKey = "Restart On Hang";
/// The source whose settings the words read and change.
constexpr const char* mains = "AC Power";

MachineSection ofMains(MachineFile& machine) {
  return machine.section(sources).section(mains);
}

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

/// Less than no minutes are told as they are, and count as never.
Reading<Minutes> minutesOf(std::int64_t number) {
  if (number < 0) return {Minutes{0}, std::to_string(number)};
  return Minutes{static_cast<unsigned long>(number)};
}

MachineSetting<Minutes> settingOf(SleepTimer timer, const PowerSource& source) {
  const auto* key = keyOf(timer);
  return {nameOf(timer), "minutes",
          [=](MachineFile& machine) {
            return std::optional(minutesOf(machine.section(sources).section(source.name).integer(key)));
          },
          [=](MachineFile::Dictionary& machine, const Minutes& minutes) {
            machine.dictionary(sources).dictionary(source.name).set(key, static_cast<std::int64_t>(minutes.count));
          }};
}

/// Absent when the machine does not support it.
MachineSetting<bool> settingOf(PowerSwitch which, const PowerSource& source) {
  const auto* key = keyOf(which);
  return {nameOf(which), "",
          [=](MachineFile& machine) {
            const auto ofSource = machine.section(sources).section(source.name);
            const auto* value = ofSource.find(key);
            return value ? std::optional(*value->asBoolean()) : std::nullopt;
          },
          [=](MachineFile::Dictionary& machine, bool isOn) {
            machine.dictionary(sources).dictionary(source.name).set(key, isOn);
          }};
}

MachineSetting<bool> restartAfterFreeze() {
  return switchAt(setting::restartAfterFreeze, powerSection, restartKey);
}

}  // namespace

Minutes ScratchPowerSettingsService::untilSleep(SleepTimer timer, const PowerSource& source) {
  return _settings.read(settingOf(timer, source)).value_or(Minutes{0});
}

void ScratchPowerSettingsService::setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) {
  _settings.change(settingOf(timer, source), minutes);
}

bool ScratchPowerSettingsService::has(PowerSwitch which, const PowerSource& source) {
  return _settings.section(sources).section(source.name).find(keyOf(which)) != nullptr;
}

bool ScratchPowerSettingsService::supports(PowerSwitch which, const PowerSource& source) {
  if (has(which, source)) return true;
  _settings.observeUnsupported(nameOf(which));
  return false;
}

bool ScratchPowerSettingsService::canSet(PowerSwitch which, const PowerSource& source) {
  if (has(which, source)) return true;
  _settings.recordUnsupported(nameOf(which));
  return false;
}

bool ScratchPowerSettingsService::isOn(PowerSwitch which, const PowerSource& source) {
  return has(which, source) && _settings.isOn(settingOf(which, source));
}

void ScratchPowerSettingsService::setOn(PowerSwitch which, const PowerSource& source, bool on) {
  _settings.change(settingOf(which, source), on);
}

bool ScratchPowerSettingsService::restartsAfterFreeze() {
  return _settings.isOn(restartAfterFreeze());
}

void ScratchPowerSettingsService::setRestartsAfterFreeze(bool restarts) {
  _settings.change(restartAfterFreeze(), restarts);
}

void ScratchPowerSettingsService::reset(SleepTimer timer) {
  const MachineOwn own{[key = keyOf(timer)](MachineFile& machine) { return ofMains(machine).find(key) != nullptr; },
                       [key = keyOf(timer)](MachineFile::Dictionary& machine) {
                         machine.dictionary(sources).dictionary(mains).remove(key);
                       }};
  _settings.reset(settingOf(timer, {mains}), own);
}

void ScratchPowerSettingsService::reset(PowerSwitch which) {
  const auto setting = settingOf(which, {mains});
  const MachineOwn own{[key = keyOf(which)](MachineFile& machine) {
                         const auto section = ofMains(machine);
                         const auto* value = section.find(key);
                         return value && *value->asBoolean();
                       },
                       [&](MachineFile::Dictionary& machine) { setting.write(machine, false); }};
  _settings.reset(setting, own);
}

void ScratchPowerSettingsService::resetRestartAfterFreeze() {
  _settings.reset(restartAfterFreeze(), ownAt(powerSection, restartKey));
}

}  // namespace tavisk
