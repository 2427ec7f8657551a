// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/LinuxPowerSettingsService.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/power/PowerValues.h"

namespace tavisk {
namespace {

bool reads(const Setting<std::string>& setting, EffectSink& effects) {
  return isOn(observe(setting, effects).value_or(""));
}

}  // namespace

LinuxPowerSettingsService::LinuxPowerSettingsService(const LinuxMachine& machine, const PowerDevices& devices)
    : _machine(machine),
      _login(machine),
      _console(machine, devices.console),
      _disks(machine),
      _network(machine, devices.cards),
      _modem(machine),
      _restart(machine, devices.controller),
      _freeze(machine) {}

Setting<std::string> LinuxPowerSettingsService::toRead(SleepTimer timer) {
  switch (timer) {
    case SleepTimer::computer:
      return _login.computerSleep();
    case SleepTimer::display:
      return _console.displaySleep();
    case SleepTimer::hardDisk:
      break;
  }
  return _disks.hardDiskSleep();
}

Setting<std::string> LinuxPowerSettingsService::toChange(SleepTimer timer, const std::string& minutes) {
  switch (timer) {
    case SleepTimer::computer:
      return _login.computerSleepChange(minutes);
    case SleepTimer::display:
      return _console.displaySleepChange(minutes);
    case SleepTimer::hardDisk:
      break;
  }
  return _disks.hardDiskSleepChange();
}

Setting<std::string> LinuxPowerSettingsService::toRead(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnModem:
      return _modem.wakeOnModem();
    case PowerSwitch::wakeOnNetworkAccess:
      return _network.wakeOnNetworkAccess();
    case PowerSwitch::restartAfterPowerFailure:
      return _restart.restartAfterPowerFailure();
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return _login.powerButtonSleep();
}

Setting<std::string> LinuxPowerSettingsService::toChange(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnModem:
      return _modem.wakeOnModemChange();
    case PowerSwitch::wakeOnNetworkAccess:
      return _network.wakeOnNetworkAccessChange();
    case PowerSwitch::restartAfterPowerFailure:
      return _restart.restartAfterPowerFailure();
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return _login.powerButtonSleepChange();
}

Minutes LinuxPowerSettingsService::untilSleep(SleepTimer timer, const PowerSource& /*source*/) {
  const auto minutes = leadingInteger(observe(toRead(timer), _machine.effects).value_or("0"));
  return {static_cast<unsigned long>(std::max<std::int64_t>(minutes, 0))};
}

void LinuxPowerSettingsService::setUntilSleep(SleepTimer timer, const PowerSource& /*source*/, Minutes minutes) {
  const auto asked = std::to_string(minutes.count);
  carryOut(toChange(timer, asked), asked, _machine.effects, _machine.runLoop);
}

bool LinuxPowerSettingsService::supports(PowerSwitch which, const PowerSource& /*source*/) {
  const auto setting = toRead(which);
  return !setting.supported || !setting.supported();
}

bool LinuxPowerSettingsService::canSet(PowerSwitch which, const PowerSource& /*source*/) {
  const auto setting = toRead(which);
  const auto reason = setting.supported ? setting.supported() : std::nullopt;
  if (reason) _machine.effects.recordUnsupported(setting.name, *reason);
  return !reason;
}

bool LinuxPowerSettingsService::isOn(PowerSwitch which, const PowerSource& source) {
  return supports(which, source) && reads(toRead(which), _machine.effects);
}

void LinuxPowerSettingsService::setOn(PowerSwitch which, const PowerSource& /*source*/, bool on) {
  carryOut(toChange(which), onOff(on), _machine.effects, _machine.runLoop);
}

bool LinuxPowerSettingsService::restartsAfterFreeze() {
  return reads(_freeze.restartAfterFreeze(), _machine.effects);
}

void LinuxPowerSettingsService::setRestartsAfterFreeze(bool restarts) {
  carryOut(_freeze.restartAfterFreezeChange(), onOff(restarts), _machine.effects, _machine.runLoop);
}

}  // namespace tavisk
