// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/LinuxNameServices.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/names/HostNameFiles.h"
#include "hosts/linux/names/NameAnnouncer.h"
#include "hosts/linux/names/OwnAddress.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

constexpr const char* setComputer = "set the computer name";
constexpr const char* setLocal = "set the host name";
constexpr std::chrono::milliseconds longestAfterLostAnswer{500};

BusObject nameService() {
  return {"org.freedesktop.hostname1", "/org/freedesktop/hostname1", "org.freedesktop.hostname1"};
}

bool isControlByte(char c) {
  return static_cast<unsigned char>(c) < ' ' || c == '\x7F';
}

/// The reason against a name that the file for it cannot hold.
std::optional<Failure> whyNotStorable(const std::string& name) {
  if (!isUtf8(name)) return Failure{setComputer, prettyNameFile, "the name is not UTF-8 text"};
  if (std::ranges::any_of(name, isControlByte))
    return Failure{setComputer, prettyNameFile, "the name holds control characters"};
  return std::nullopt;
}

using Value = std::optional<std::string>;

Result<Value> storedComputerNameOf(const SystemRoot& root) {
  auto name = prettyHostName(root);
  if (!name || *name) return name;
  return staticHostName(root);
}

Result<Value> computerNameOf(const SystemRoot& root) {
  auto name = storedComputerNameOf(root);
  if (!name || *name) return name;
  return kernelHostName(root);
}

/// Those of the lines with the machine's names that are its own.
Result<std::vector<std::string>> ownAddresses(const std::string& hosts, const std::vector<std::string>& names) {
  std::vector<std::string> own;
  for (auto& address : addressesNamed(hosts, names)) {
    const auto isOwn = isOwnAddress(address);
    if (!isOwn) return isOwn.failure();
    if (*isOwn) own.push_back(std::move(address));
  }
  return own;
}

Result<Value> localNameOf(const LinuxMachine& machine) {
  auto announced = NameAnnouncer(machine.services, machine.runLoop).name();
  if (!announced || *announced) return announced;
  auto name = kernelHostName(machine.root);
  if (!name || !*name) return name;
  return Value(firstLabel(**name));
}

class LinuxSession final : public DynamicStore::Session {
 public:
  explicit LinuxSession(const LinuxMachine& machine) : _machine(machine) {}

  Value computerName() override {
    Setting<std::string> setting;
    setting.name = setting::computerName;
    setting.where = prettyNameFile;
    setting.live = [this] { return computerNameOf(_machine.root); };
    setting.stored = [this] { return storedComputerNameOf(_machine.root); };
    return observe(setting, _machine.effects);
  }
  Value localHostName() override {
    Setting<std::string> setting;
    setting.name = setting::localSubnetName;
    setting.where = staticNameFile;
    setting.undoneBy = [this](const auto& stored) { return whoUndoesHostName(_machine.root, stored); };
    setting.live = [this] { return localNameOf(_machine); };
    setting.stored = [this] { return staticHostName(_machine.root); };
    return observe(setting, _machine.effects);
  }

 private:
  LinuxMachine _machine;
};

}  // namespace

Result<bool> LinuxHostConfigService::setByService(const char* member, const std::string& name) {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return false;
  const auto set = (*bus)->call(nameService(), member, "", name, false);
  if (set) return true;
  if (set.failure().code == BusErrorCode::serviceUnknown) return false;
  return set.failure();
}

void LinuxHostConfigService::setComputerName(const std::string& name) {
  Setting<std::string> setting;
  setting.name = setting::computerName;
  setting.where = prettyNameFile;
  setting.live = [this] { return serviceComputerName(); };
  setting.stored = [this] { return prettyHostName(_machine.root); };
  setting.check = [this](const std::string& value) { return checkComputerName(value); };
  setting.store = [this](const std::string& value) { return storeComputerName(value); };
  carryOut(setting, name, _machine);
}

/// Where the service does not run, who asks for the name reads the file.
Result<LinuxHostConfigService::Value> LinuxHostConfigService::serviceComputerName() {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return prettyHostName(_machine.root);
  auto name = (*bus)->property(nameService(), "PrettyHostname", "s");
  if (name) return Value(std::move(name).value().readText());
  if (name.failure().code == BusErrorCode::serviceUnknown) return prettyHostName(_machine.root);
  return name.failure();
}

Result<void> LinuxHostConfigService::checkComputerName(const std::string& name) {
  if (auto failure = whyNotStorable(name)) return *failure;
  return checkFile(setComputer, prettyNameFile);
}

/// Without the service it is left to the file, which only root writes.
Result<void> LinuxHostConfigService::checkFile(const char* tried, const char* file) {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  const auto failure = *bus ? std::nullopt : whyNeedsRoot(tried, file);
  return failure ? Result<void>(*failure) : Result<void>();
}

Result<void> LinuxHostConfigService::storeComputerName(const std::string& name) {
  const auto set = setByService("SetPrettyHostname", name);
  if (!set) return set.failure();
  if (*set) return {};
  if (auto failure = whyNeedsRoot(setComputer, prettyNameFile)) return *failure;
  return setPrettyHostName(_machine.root, name);
}

void LinuxHostConfigService::setLocalNetworkName(const std::string& name) {
  Setting<std::string> setting;
  setting.name = setting::localSubnetName;
  setting.where = staticNameFile;
  setting.undoneBy = [this](const auto& asked) { return whoUndoesHostName(_machine.root, asked); };
  setting.note = [this](const auto& asked) { return whyNotResolved(_machine.root, asked); };
  setting.live = [&] { return liveLocalName(name); };
  setting.liveFor = firstLabel;
  setting.stored = [this] { return storedLocalName(); };
  WrittenPlaces written;
  setting.written = [&] { return written.text(); };
  setting.check = [this](const std::string& value) { return checkLocalName(value); };
  setting.store = [&](const std::string& value) { return storeLocalName(value, written); };
  setting.apply = [this](const std::string& value) { return applyLocalName(value); };
  setting.settled = [this](const std::string&) { return _announcer.hasRegistered().valueOr(false); };
  carryOut(setting, name, _machine);
}

/// The first label, by which the network knows the machine, and the kernel's whole name where it is another one.
Setting<std::string>::Found LinuxHostConfigService::liveLocalName(const std::string& asked) {
  const auto announced = _announcer.respondersName();
  if (!announced) return announced.failure();
  const auto kernels = kernelHostName(_machine.root);
  if (!kernels) return kernels.failure();
  if (!*announced && !*kernels) return std::nullopt;
  const auto name = kernels->value_or("");
  const auto label = firstLabel(name);
  const bool isAnnounced = !*announced || compareIgnoringCase(**announced, label) == 0;
  if (isAnnounced) return std::optional(Reading(label, name == asked ? "" : name));
  return std::optional(Reading(**announced, name == asked ? "" : **announced + ", " + name + " in the kernel"));
}

/// The name in its file, and with it that the machine's own line among the hosts has another one.
Setting<std::string>::Found LinuxHostConfigService::storedLocalName() {
  const auto name = staticHostName(_machine.root);
  if (!name) return name.failure();
  const auto hosts = hostsOf(_machine.root);
  if (!hosts) return hosts.failure();
  if (!*name) return std::nullopt;
  const bool isStale = hostsNameTheMachine(*hosts) && !hostsName(*hosts, **name);
  const auto stale = isStale ? **name + ", another one in " + hostsFile : "";
  return std::optional(Reading(**name, stale));
}

/// The file of hosts with the name in place of the ones that the machine had.
Result<LinuxHostConfigService::Renamed> LinuxHostConfigService::hostsRenamed(const std::string& name) const {
  const auto stored = staticHostName(_machine.root);
  if (!stored) return stored.failure();
  const auto kernels = kernelHostName(_machine.root);
  if (!kernels) return kernels.failure();
  const auto hosts = hostsOf(_machine.root);
  if (!hosts) return hosts.failure();
  const std::vector<std::string> before{stored->value_or(""), kernels->value_or("")};
  const auto own = ownAddresses(*hosts, before);
  if (!own) return own.failure();
  return Renamed{*stored == name, *hosts, hostsWithName(*hosts, before, name, *own)};
}

/// The name is refused here before it reaches a service that would cut it off.
Result<void> LinuxHostConfigService::checkLocalName(const std::string& name) {
  if (name.empty() || name.size() > longestKernelHostName)
    return Failure{setLocal, staticNameFile, "the kernel holds names of 1 to 64 bytes"};
  const auto renamed = hostsRenamed(name);
  if (!renamed) return renamed.failure();
  if (auto failure = whyAnnouncingNeedsRoot(name)) return *failure;
  const auto failure = renamed->after != renamed->before ? whyNeedsRoot(setLocal, hostsFile) : std::nullopt;
  return failure ? Result<void>(*failure) : checkFile(setLocal, staticNameFile);
}

Result<void> LinuxHostConfigService::storeLocalName(const std::string& name, WrittenPlaces& written) {
  const auto renamed = hostsRenamed(name);
  if (!renamed) return renamed.failure();
  // Before the name itself: when a run ends in between, setting the name again completes the change.
  if (renamed->after != renamed->before) {
    if (auto changed = _machine.root.write(hostsFile, renamed->after); !changed) return changed;
    written.add(hostsFile);
  }
  if (renamed->isStored) return {};
  const auto set = storeStaticName(name);
  if (!set) return putBackHosts(renamed->before, name, set.failure(), written);
  written.add(staticNameFile);
  return {};
}

/// Where the name was stored all the same it is right among the hosts too.
Failure LinuxHostConfigService::putBackHosts(const std::string& hosts, const std::string& name, Failure cause,
                                             WrittenPlaces& written) {
  if (isStoredAfterAll(name, cause)) {
    written.add(staticNameFile);
    return cause;
  }
  if (written.text().empty()) return cause;
  const auto restored = _machine.root.write(hostsFile, hosts);
  if (restored)
    written = {};
  else
    cause.why += "; " + describe(restored.failure());
  return cause;
}

/// A service that was asked and whose answer was lost goes on with what it was asked for.
bool LinuxHostConfigService::isStoredAfterAll(const std::string& name, const Failure& cause) const {
  const auto isStored = [&] { return staticHostName(_machine.root).valueOr(std::nullopt) == name; };
  if (cause.code == BusErrorCode::accessDenied || cause.code == BusErrorCode::interactionRequired) return isStored();
  const auto looks = _machine.runLoop.every(std::chrono::milliseconds(20), [] {});
  return _machine.runLoop.runUntil(RunLoop::Clock::now() + longestAfterLostAnswer, isStored);
}

/// The responder takes a name from root alone, and is told it last.
std::optional<Failure> LinuxHostConfigService::whyAnnouncingNeedsRoot(const std::string& name) {
  const auto announced = _announcer.respondersName();
  if (!announced) return announced.failure();
  const bool isToBeTold = *announced && compareIgnoringCase(**announced, firstLabel(name)) != 0;
  return isToBeTold ? whyNeedsRoot("announce the host name", "org.freedesktop.Avahi") : std::nullopt;
}

Result<void> LinuxHostConfigService::storeStaticName(const std::string& name) {
  const auto set = setByService("SetStaticHostname", name);
  if (!set) return set.failure();
  if (*set) return {};
  if (auto failure = whyNeedsRoot(setLocal, staticNameFile)) return *failure;
  return setStaticHostName(_machine.root, name);
}

Result<void> LinuxHostConfigService::applyLocalName(const std::string& name) {
  const auto kernels = kernelHostName(_machine.root);
  if (!kernels) return kernels.failure();
  if (*kernels != name) {
    if (auto failure = whyNeedsRoot(setLocal, "the kernel")) return *failure;
    if (auto set = setKernelHostName(_machine.root, name); !set) return set;
  }
  const auto announced = _announcer.respondersName();
  if (!announced) return announced.failure();
  const auto label = firstLabel(name);
  if (!*announced || compareIgnoringCase(**announced, label) == 0) return {};
  return _announcer.announce(label);
}

std::unique_ptr<DynamicStore::Session> LinuxDynamicStore::open(const std::string& /*clientName*/) {
  return std::make_unique<LinuxSession>(_machine);
}

}  // namespace tavisk
