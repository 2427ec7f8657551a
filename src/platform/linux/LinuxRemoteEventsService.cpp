// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxRemoteEventsService.h"

#include "platform/SettingNames.h"
#include "platform/linux/OnOff.h"
#include "platform/linux/ServicesConfig.h"

namespace tavisk {

Result<DaemonGroup> LinuxRemoteEventsService::units() {
  auto units = configuredUnits(_machine.root, "remote-events");
  if (!units) return units.failure();
  return DaemonGroup(_machine.services.daemons(), std::move(units).value());
}

std::optional<Failure> LinuxRemoteEventsService::whyNotSupported() {
  const auto named = units();
  if (!named) return std::nullopt;
  if (named->members().empty()) return Failure{"find units", servicesConfig, "it names none for remote-events"};
  const auto present = named->present();
  if (!present || present->members().size() == named->members().size()) return std::nullopt;
  return Failure{"find units", named->names(), "not all of them are installed"};
}

Result<std::optional<std::string>> LinuxRemoteEventsService::live() {
  const auto named = units();
  if (!named) return named.failure();
  const auto running = named->running();
  if (!running) return running.failure();
  if (!running->empty() && running->size() < named->members().size()) return std::optional<std::string>("partly on");
  return asOnOff(!running->empty());
}

/// That of the first unit: a service that its socket starts is never enabled itself.
Result<bool> LinuxRemoteEventsService::startsAtBoot() {
  const auto named = units();
  if (!named) return named.failure();
  if (named->members().empty()) return false;
  return _machine.services.daemons().startsAtBoot(named->members().front());
}

Result<bool> LinuxRemoteEventsService::isOnInAnyWay() {
  auto starts = startsAtBoot();
  if (!starts || *starts) return starts;
  const auto named = units();
  if (!named) return named.failure();
  if (named->members().empty()) return false;
  return _machine.services.daemons().isRunning(named->members().front());
}

bool LinuxRemoteEventsService::isEnabled() {
  Setting setting;
  setting.name = setting::remoteEvents;
  setting.live = [this] { return asOnOff(isOnInAnyWay()); };
  return observe(setting, _machine.effects) == onOff(true);
}

void LinuxRemoteEventsService::setEnabled(bool enabled) {
  Setting setting;
  setting.name = setting::remoteEvents;
  setting.supported = [this] { return whyNotSupported(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return asOnOff(startsAtBoot()); };
  setting.store = [&](const std::string&) {
    const auto named = units();
    return named ? named->setAllStartAtBoot(enabled) : named.failure();
  };
  setting.apply = [&](const std::string&) -> Result<void> {
    const auto named = units();
    if (!named) return named.failure();
    return enabled ? named->startAll() : named->stopAll();
  };
  carryOut(setting, onOff(enabled), _machine.effects, _machine.runLoop);
}

}  // namespace tavisk
