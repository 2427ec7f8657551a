// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/LinuxPowerSettingsService.h"

namespace tavisk {
namespace {

/// A look that fails is told as such: nobody knows then whether the machine can have the setting.
Support supportOf(const Setting<bool>& setting, EffectSink& effects) {
  auto support = setting.supported ? setting.supported() : Support(std::nullopt);
  if (!support) effects.recordFailure(setting.name, support.failure());
  return support;
}

bool isSupported(const Setting<bool>& setting, EffectSink& effects) {
  const auto support = supportOf(setting, effects);
  return support && !*support;
}

}  // namespace

LinuxPowerSettingsService::LinuxPowerSettingsService(const LinuxMachine& machine, const PowerDevices& devices)
    : _machine(machine),
      _computerSleep(machine),
      _displaySleep(machine, devices.console),
      _hardDiskSleep(machine),
      _wakeOnNetworkAccess(machine, devices.cards),
      _wakeOnModem(machine),
      _restartAfterPowerFailure(machine, devices.controller),
      _restartAfterFreeze(machine) {}

Setting<Minutes> LinuxPowerSettingsService::settingOf(SleepTimer timer) {
  switch (timer) {
    case SleepTimer::computer:
      return _computerSleep.computerSleep();
    case SleepTimer::display:
      return _displaySleep.displaySleep();
    case SleepTimer::hardDisk:
      break;
  }
  return _hardDiskSleep.hardDiskSleep();
}

Setting<bool> LinuxPowerSettingsService::settingOf(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnModem:
      return _wakeOnModem.wakeOnModem();
    case PowerSwitch::wakeOnNetworkAccess:
      return _wakeOnNetworkAccess.wakeOnNetworkAccess();
    case PowerSwitch::restartAfterPowerFailure:
      return _restartAfterPowerFailure.restartAfterPowerFailure();
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return _computerSleep.powerButtonSleep();
}

Minutes LinuxPowerSettingsService::untilSleep(SleepTimer timer, const PowerSource& /*source*/) {
  return observe(settingOf(timer), _machine.effects).value_or(Minutes{});
}

void LinuxPowerSettingsService::setUntilSleep(SleepTimer timer, const PowerSource& /*source*/, Minutes minutes) {
  carryOut(settingOf(timer), minutes, _machine);
}

bool LinuxPowerSettingsService::supports(PowerSwitch which, const PowerSource& /*source*/) {
  const auto setting = settingOf(which);
  const auto support = supportOf(setting, _machine.effects);
  if (support && *support) _machine.effects.observe({.setting = setting.name, .unsupported = (*support)->reason});
  return support && !*support;
}

bool LinuxPowerSettingsService::canSet(PowerSwitch which, const PowerSource& /*source*/) {
  const auto setting = settingOf(which);
  const auto support = supportOf(setting, _machine.effects);
  if (support && *support) _machine.effects.recordUnsupported(setting.name, (*support)->reason);
  return support && !*support;
}

bool LinuxPowerSettingsService::isOn(PowerSwitch which, const PowerSource& /*source*/) {
  auto setting = settingOf(which);
  if (!isSupported(setting, _machine.effects)) return false;
  setting.supported = nullptr;
  return observe(setting, _machine.effects).value_or(false);
}

void LinuxPowerSettingsService::setOn(PowerSwitch which, const PowerSource& /*source*/, bool on) {
  carryOut(settingOf(which), on, _machine);
}

bool LinuxPowerSettingsService::restartsAfterFreeze() {
  return observe(_restartAfterFreeze.restartAfterFreeze(), _machine.effects).value_or(false);
}

void LinuxPowerSettingsService::setRestartsAfterFreeze(bool restarts) {
  carryOut(_restartAfterFreeze.restartAfterFreeze(), restarts, _machine);
}

void LinuxPowerSettingsService::reset(SleepTimer timer) {
  tavisk::reset(settingOf(timer), _machine);
}

void LinuxPowerSettingsService::reset(PowerSwitch which) {
  tavisk::reset(settingOf(which), _machine);
}

void LinuxPowerSettingsService::resetRestartAfterFreeze() {
  tavisk::reset(_restartAfterFreeze.restartAfterFreeze(), _machine);
}

}  // namespace tavisk
