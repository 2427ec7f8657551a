// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/MachineCopy.h"

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <utility>
#include <vector>

#include "base/PropertyList.h"
#include "effects/SettingNames.h"
#include "hosts/rehearsal/DiskCopy.h"
#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/MachineSettings.h"

namespace tavisk {
namespace {

using Dictionary = PropertyList::Dictionary;

constexpr const char* source = "AC Power";
constexpr const char* controllerClasses[] = {"VelmarPMU", "VelmarSMU", "VelmarKCS"};
constexpr std::uint32_t connectionType = 0x0101FACE;

/// What the services tell while they are asked.
class Answers final : public EffectChannel {
 public:
  explicit Answers(EffectSink& effects) : _effects(effects) { _effects.addChannel(*this); }
  ~Answers() override { _effects.removeChannel(*this); }
  Answers(const Answers&) = delete;
  Answers& operator=(const Answers&) = delete;

  void record(const Effect& effect) override {
    if (effect.outcome == Outcome::failed && effect.failure) _failures.emplace(effect.setting, *effect.failure);
  }
  void observe(const SettingValue& value) override { _values.insert_or_assign(value.setting, value); }
  bool wantsValues() const override { return true; }

  std::optional<std::string> stored(const char* setting) const {
    const auto told = _values.find(setting);
    return told == _values.end() ? std::nullopt : told->second.stored;
  }
  /// Why something of a setting is not known, by its name.
  const std::map<std::string, Failure>& failures() const { return _failures; }
  /// The same where nothing is.
  std::map<std::string, Failure> unknown() const {
    auto unknown = _failures;
    std::erase_if(unknown, [this](const auto& failed) { return _values.contains(failed.first); });
    return unknown;
  }

 private:
  EffectSink& _effects;
  std::map<std::string, SettingValue> _values;
  std::map<std::string, Failure> _failures;
};

void setIfAny(Dictionary& section, const char* key, const std::optional<std::string>& text) {
  if (text) section.set(key, *text);
}

void copyClock(ClockService& clock, Dictionary& section) {
  using std::chrono::system_clock;
  constexpr std::int64_t nearlyNow = 2;
  const auto ahead = clock.now() - system_clock::to_time_t(system_clock::now());
  if (ahead < -nearlyNow || ahead > nearlyNow) section.set("Offset", ahead);
  section.set("Time Zone", clock.timeZone().text);
  PropertyList::Array zones;
  for (const auto& zone : clock.knownTimeZones()) zones.emplace_back(zone.text);
  section.set("Known Time Zones", std::move(zones));
}

void copyNetworkTime(NetworkTimeService& client, const Answers& answers, Dictionary& section) {
  section.set("Running", client.isRunning());
  section.set("Launch At Startup", answers.stored(setting::networkTime) == "on");
  section.set("Server", client.server().address);
}

void copyPower(PowerSettingsService& power, Dictionary& section) {
  for (const auto& [timer, key] : {std::pair(SleepTimer::computer, "System Sleep"),
                                   {SleepTimer::display, "Display Sleep"},
                                   {SleepTimer::hardDisk, "Disk Sleep"}})
    section.set(key, static_cast<std::int64_t>(power.untilSleep(timer, {source}).count));
  for (const auto& [which, key] : {std::pair(PowerSwitch::wakeOnModem, "Wake On Ring"),
                                   {PowerSwitch::wakeOnNetworkAccess, "Wake On LAN"},
                                   {PowerSwitch::restartAfterPowerFailure, "Auto Restart"},
                                   {PowerSwitch::powerButtonSleep, "Power Button Sleep"}})
    if (power.supports(which, {source})) section.set(key, power.isOn(which, {source}));
}

void copyNames(DynamicStore& store, const Answers& answers, Dictionary& machine) {
  auto& live = machine.dictionary("Dynamic Store");
  const auto session = store.open("taviskctl");
  if (!session) {
    live.set("Available", false);
    return;
  }
  setIfAny(live, "Computer Name", session->computerName());
  setIfAny(live, "Local Host Name", session->localHostName());
  auto& configured = machine.dictionary("Host Configuration");
  setIfAny(configured, "Computer Name", answers.stored(setting::computerName));
  setIfAny(configured, "Local Host Name", answers.stored(setting::localSubnetName));
}

void copyController(PowerController& controller, Dictionary& registry) {
  if (const auto status = controller.masterPort(); status != 0) registry.set("Master Port Status", status);
  for (const auto* name : controllerClasses) {
    const auto service = controller.serviceOfClass(name);
    if (!service) continue;
    auto& copied = registry.dictionary("Services").dictionary(name);
    if (const auto delay = controller.numberProperty(service, "ServerID")) copied.set("ServerID", *delay);
    if (const auto opened = controller.open(service, connectionType); opened.first != 0)
      copied.set("Open Status", opened.first);
    return;
  }
}

void copyDefaults(UserDefaults& defaults, Dictionary& section) {
  if (defaults.boolean(startupDiskDebugKey)) section.set(startupDiskDebugKey, true);
  if (const auto languages = defaults.strings("VelmarLanguages"); languages && !languages->empty())
    section.set("VelmarLanguages", PropertyList::Array(languages->begin(), languages->end()));
  if (const auto interval = defaults.number("SDWirestartScanInterval"))
    section.set("SDWirestartScanInterval", *interval);
}

void copyKernel(Host& host, Dictionary& machine) {
  auto& kernel = machine.dictionary("Kernel");
  kernel.set("Model", host.kernel().model());
  kernel.set("Epoch", std::int64_t{host.kernel().epoch()});
  kernel.set("Network Start", std::int64_t{host.kernel().networkStart()});
  if (const auto number = host.keyboardInput().currentLayoutNumber(); number && *number)
    machine.dictionary("Keyboard Input").set("Layout Number", **number);
}

Dictionary described(Host& host, const Answers& answers) {
  Dictionary machine;
  copyClock(host.clock(), machine.dictionary("Clock"));
  copyNetworkTime(host.networkTime(), answers, machine.dictionary("Network Time"));
  copyPower(host.powerSettings(), machine.dictionary("Power Sources").dictionary(source));
  machine.dictionary("Power").set("Restart On Hang", host.powerSettings().restartsAfterFreeze());
  machine.dictionary("Remote Shell").set("Enabled", host.remoteShell().isEnabled());
  machine.dictionary("Remote Events").set("Enabled", host.remoteEvents().isEnabled());
  copyNames(host.dynamicStore(), answers, machine);
  if (const auto preference = host.preferences().value(DunmereLockEnclosureStateKey))
    machine.dictionary("Preferences").set(DunmereLockEnclosureStateKey, *preference);
  copyController(host.powerController(), machine.dictionary("Registry"));
  copyDefaults(host.userDefaults(), machine.dictionary("User Defaults"));
  copyKernel(host, machine);
  return machine;
}

/// Where the loader's file is damaged the copy refuses to read it, as the machine does.
Result<void> copyLoaderFile(BootLoaderFile& file, const std::string& directory) {
  const auto contents = file.read();
  if (!contents || !*contents) return {};
  const auto text = writePropertyList(**contents);
  if (!text) return text.failure();
  return SystemRoot(directory + "/root").write(BootLoaderFile::path, *text);
}

}  // namespace

Result<void> copyMachine(const MachineToCopy& machine, const PlaceOfCopy& place, EffectSink& audience) {
  const Answers answers(machine.effects);
  auto described = tavisk::described(machine.host, answers);
  if (place.hasDisks) copyDisks(machine.host, machine.runLoop, described);
  if (auto copied = copyLoaderFile(machine.host.bootLoaderFile(), place.directory); !copied) return copied;
  for (const auto& [setting, failure] : answers.failures()) audience.recordFailure(setting, failure);
  for (const auto& [setting, failure] : answers.unknown())
    described.dictionary("Refusals").set(setting + " (read)", refusalTelling(failure));
  EffectSink unwatched;
  const auto file = MachineFile::open(place.directory, unwatched);
  if (!file) return file.failure();
  return (*file)->change([&](Dictionary& written) { written = std::move(described); });
}

}  // namespace tavisk
