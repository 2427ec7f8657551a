// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/RehearsedServices.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"

namespace tavisk {
namespace {

bool hasFailed(const Stage::Effects& effects) {
  return std::ranges::any_of(effects, [](const Effect& effect) { return effect.outcome == Outcome::failed; });
}

bool isApplied(const Stage::Effects& effects) {
  return std::ranges::any_of(effects, [](const Effect& effect) { return effect.outcome == Outcome::applied; });
}

/// The live value that comes of a change, or is there already; absent where it is not made.
std::optional<std::string> liveAfter(const Stage::Effects& effects) {
  for (const auto outcome : {Outcome::applied, Outcome::unchanged}) {
    const auto granted = std::ranges::find(effects, outcome, &Effect::outcome);
    if (granted != effects.end()) return granted->live;
  }
  return std::nullopt;
}

}  // namespace

void RehearsedClock::setTime(std::int64_t secondsSince1970) {
  _stage.play([=](Host& host) { host.clock().setTime(secondsSince1970); });
}

/// The machine may know the zone by another name.
void RehearsedClock::setTimeZone(const ZoneName& zone) {
  _stage.play([&](Host& host) { host.clock().setTimeZone(zone); },
              [&](Host& copy, const Stage::Effects& effects) {
                copy.clock().setTimeZone({liveAfter(effects).value_or(zone.text)});
              });
}

void RehearsedNetworkTime::setLaunchAtStartup(bool launch) {
  _stage.play([=](Host& host) { host.networkTime().setLaunchAtStartup(launch); });
}

/// After a change of it has been rehearsed it is what that has made it.
void RehearsedNetworkTime::checkLaunchAtStartup(bool launch) {
  const auto state = _stage.stateOf(setting::networkTimeAtStartup);
  if (state && state->asked == (launch ? "on" : "off")) return;
  _stage.tell(_stage.foretold([=](Host& host) { host.networkTime().checkLaunchAtStartup(launch); }));
}

void RehearsedNetworkTime::start() {
  const auto effects = _stage.play([](Host& host) { host.networkTime().start(); });
  _isServerChanged = _isServerChanged && !isApplied(effects);
}

void RehearsedNetworkTime::stop() {
  _stage.play([](Host& host) { host.networkTime().stop(); });
}

void RehearsedNetworkTime::setServer(const NetworkTimeServer& server) {
  const auto effects = _stage.play([&](Host& host) { host.networkTime().setServer(server); });
  _isServerChanged = _isServerChanged || isApplied(effects);
}

/// The machine knows of no server that was rehearsed: whether its client has read it is said here.
void RehearsedNetworkTime::restartAsynchronously() {
  auto effects = _stage.foretold([](Host& host) { host.networkTime().restartAsynchronously(); });
  for (auto& effect : effects)
    if (!effect.failure && _stage.stateOf(setting::networkTimeServer))
      effect.outcome = _isServerChanged ? Outcome::applied : Outcome::unchanged;
  _isServerChanged = _isServerChanged && hasFailed(effects);
  _stage.tell(effects);
}

Minutes RehearsedPowerSettings::untilSleep(SleepTimer timer, const PowerSource& source) {
  return _stage.copy().powerSettings().untilSleep(timer, source);
}

/// The machine may not do quite what is asked.
void RehearsedPowerSettings::setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) {
  _stage.play([&](Host& host) { host.powerSettings().setUntilSleep(timer, source, minutes); },
              [&](Host& copy, const Stage::Effects& effects) {
                const auto live = parseNumber<unsigned long>(liveAfter(effects).value_or(""));
                copy.powerSettings().setUntilSleep(timer, source, Minutes{live.value_or(minutes.count)});
              });
}

bool RehearsedPowerSettings::supports(PowerSwitch which, const PowerSource& source) {
  return _stage.copy().powerSettings().supports(which, source);
}

bool RehearsedPowerSettings::canSet(PowerSwitch which, const PowerSource& source) {
  bool canSet = false;
  _stage.tell(_stage.foretold([&](Host& host) { canSet = host.powerSettings().canSet(which, source); }));
  return canSet;
}

bool RehearsedPowerSettings::isOn(PowerSwitch which, const PowerSource& source) {
  return _stage.copy().powerSettings().isOn(which, source);
}

void RehearsedPowerSettings::setOn(PowerSwitch which, const PowerSource& source, bool on) {
  _stage.play([&](Host& host) { host.powerSettings().setOn(which, source, on); });
}

void RehearsedPowerSettings::setRestartsAfterFreeze(bool restarts) {
  _stage.play([=](Host& host) { host.powerSettings().setRestartsAfterFreeze(restarts); });
}

std::optional<PowerController::Service> RehearsedPowerController::serviceOfClass(const std::string& className) {
  return copy().serviceOfClass(className);
}

std::optional<std::int64_t> RehearsedPowerController::numberProperty(const std::optional<Service>& service,
                                                                     const std::string& property) {
  return copy().numberProperty(service, property);
}

std::pair<ControllerStatus, PowerController::Connection> RehearsedPowerController::open(
    const std::optional<Service>& service, std::uint32_t connectionType) {
  std::pair<ControllerStatus, Connection> opened;
  _stage.tell(_stage.foretold([&](Host& host) { opened = host.powerController().open(service, connectionType); }));
  return opened;
}

ControllerStatus RehearsedPowerController::setProperties(const Connection& connection,
                                                         const PropertyList::Dictionary& properties,
                                                         std::int64_t asked) {
  ControllerStatus status = 0;
  _stage.play(
      [&](Host& host) { status = host.powerController().setProperties(connection, properties, asked); },
      [&](Host& copy, const Stage::Effects&) { copy.powerController().setProperties(connection, properties, asked); });
  return status;
}

template <typename Service>
RemoteAccessState RehearsedRemoteAccess<Service>::state() {
  const auto rehearsed = _stage.stateOf(_setting);
  if (!rehearsed) return _serviceOf(_stage.machine()).state();
  static_cast<void>(_serviceOf(_stage.copy()).state());
  if (rehearsed->live == rehearsed->stored)
    return rehearsed->live == "on" ? RemoteAccessState::on : RemoteAccessState::off;
  return RemoteAccessState::partly;
}

template <typename Service>
void RehearsedRemoteAccess<Service>::setEnabled(bool enabled) {
  _stage.play([&](Host& host) { _serviceOf(host).setEnabled(enabled); });
  if (!_stage.stateOf(_setting)) return;
  const bool isEnabled = isOn(state());
  _stage.edit([&](PropertyList::Dictionary& machine) { machine.dictionary(_section).set("Enabled", isEnabled); });
}

template class RehearsedRemoteAccess<RemoteShellService>;
template class RehearsedRemoteAccess<RemoteEventsService>;

namespace {

constexpr const char* live = "Dynamic Store";
constexpr const char* configured = "Host Configuration";
constexpr const char* computerName = "Computer Name";
constexpr const char* localName = "Local Host Name";

}  // namespace

void RehearsedHostConfiguration::setComputerName(const std::string& name) {
  const auto effects = _stage.play([&](Host& host) { host.hostConfiguration().setComputerName(name); });
  if (isApplied(effects) && name.empty() && _showsHostName) showHostName();
}

/// The network may know less of the name than was asked for, also where that is stored already.
void RehearsedHostConfiguration::setLocalNetworkName(const std::string& name) {
  const auto effects = _stage.play([&](Host& host) { host.hostConfiguration().setLocalNetworkName(name); });
  const auto shown = liveAfter(effects);
  if (!shown) return;
  _stage.edit([&](PropertyList::Dictionary& machine) { machine.dictionary(live).set(localName, *shown); });
  if (_showsHostName && !hasComputerName()) showHostName();
}

void RehearsedHostConfiguration::showHostName() {
  _stage.edit([](PropertyList::Dictionary& machine) {
    const auto* name = machine.dictionary(configured).find(localName);
    if (!name) return;
    const auto shown = *name;
    for (const auto* section : {live, configured}) machine.dictionary(section).set(computerName, shown);
  });
}

/// A machine without one has nothing to do when it is taken away.
bool RehearsedHostConfiguration::hasComputerName() {
  if (const auto rehearsed = _stage.stateOf(setting::computerName)) return !rehearsed->asked.empty();
  const auto effects = _stage.foretold([](Host& host) { host.hostConfiguration().setComputerName(""); });
  return !std::ranges::all_of(effects, [](const Effect& effect) { return effect.outcome == Outcome::unchanged; });
}

bool RehearsedBootLoaderFile::write(const PropertyList::Dictionary& contents) {
  return !hasFailed(_stage.play([&](Host& host) { host.bootLoaderFile().write(contents); }));
}

BootSettings::BootPreference RehearsedDiskManagement::bootPreference() {
  if (!_chosen) return machine().bootPreference();
  _stage.tell(SettingValue{.setting = setting::startupDisk, .live = _chosen->text, .stored = _chosen->text});
  return {0, _chosen};
}

/// Who has chosen a disk starts from it.
BootSettings::NetworkBootPreference RehearsedDiskManagement::networkBootPreference() {
  if (_chosen) return {};
  return machine().networkBootPreference();
}

ServiceStatus RehearsedDiskManagement::setBootPreference(const BootChoice& choice) {
  const auto status = change([&](DiskManagementService& service) { return service.setBootPreference(choice); });
  if (status == 0) _chosen = choice.disk;
  return status;
}

ServiceStatus RehearsedDiskManagement::setFirmwareVariable(const std::string& name, const Result<std::string>& value) {
  return change([&](DiskManagementService& service) { return service.setFirmwareVariable(name, value); });
}

/// The status is the machine's.
ServiceStatus RehearsedDiskManagement::change(const std::function<ServiceStatus(DiskManagementService&)>& set) {
  ServiceStatus status = 0;
  _stage.play([&](Host& host) { status = set(host.diskManagement()); },
              [&](Host& copy, const Stage::Effects&) {
                if (status == 0) set(copy.diskManagement());
              });
  return status;
}

void RehearsedProcesses::sendSignal(int signal, ProcessId process) {
  _stage.play([=](Host& host) { host.processes().sendSignal(signal, process); });
}

void RehearsedProcesses::setLockEnclosureState(bool disablesKeyboard) {
  _pending.emplace_back([=](ProcessUtilities& processes) { processes.setLockEnclosureState(disablesKeyboard); });
}

void RehearsedProcesses::setMachineBoolean(const std::string& key, bool value) {
  _pending.emplace_back([=](ProcessUtilities& processes) { processes.setMachineBoolean(key, value); });
}

void RehearsedProcesses::writeMachinePreferences() {
  const auto pending = std::exchange(_pending, {});
  _stage.play([&](Host& host) {
    for (const auto& set : pending) set(host.processes());
    host.processes().writeMachinePreferences();
  });
}

}  // namespace tavisk
