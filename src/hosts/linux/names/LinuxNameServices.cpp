// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/LinuxNameServices.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/names/HostNameFiles.h"
#include "hosts/linux/names/NameAnnouncer.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

constexpr const char* setComputer = "set the computer name";
constexpr const char* setLocal = "set the host name";

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

Result<Value> computerNameOf(const SystemRoot& root) {
  auto name = prettyHostName(root);
  if (!name || *name) return name;
  name = staticHostName(root);
  if (!name || *name) return name;
  return kernelHostName(root);
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
    return look(setting::computerName, [this] { return computerNameOf(_machine.root); });
  }
  Value localHostName() override {
    return look(setting::localSubnetName, [this] { return localNameOf(_machine); });
  }

 private:
  Value look(const char* name, const Setting<std::string>::Read& read) {
    Setting<std::string> setting;
    setting.name = name;
    setting.live = read;
    return observe(setting, _machine.effects);
  }

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

Result<void> LinuxHostConfigService::storeComputerName(const std::string& name) {
  if (auto failure = whyNotStorable(name)) return *failure;
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
  setting.live = [this] { return liveLocalName(); };
  setting.stored = [this] { return storedLocalName(); };
  setting.store = [this](const std::string& value) { return storeLocalName(value); };
  setting.apply = [this](const std::string& value) { return applyLocalName(value); };
  carryOut(setting, name, _machine);
}

/// The kernel's name, unless another one is announced than its first label.
Result<LinuxHostConfigService::Value> LinuxHostConfigService::liveLocalName() {
  auto announced = _announcer.respondersName();
  if (!announced) return announced;
  auto name = kernelHostName(_machine.root);
  if (!name || !*announced) return name;
  const auto label = firstLabel(name->value_or(""));
  return compareIgnoringCase(**announced, label) == 0 ? name : announced;
}

/// The name in its file, and with it that the machine's own line among the hosts has another one.
Setting<std::string>::Found LinuxHostConfigService::storedLocalName() {
  const auto name = staticHostName(_machine.root);
  if (!name) return name.failure();
  const auto hosts = hostsOf(_machine.root);
  if (!hosts) return hosts.failure();
  if (!*name) return std::nullopt;
  const auto stale = hostsName(*hosts, **name) ? "" : **name + ", another one in " + hostsFile;
  return std::optional(Reading(**name, stale));
}

/// The name is refused here before it reaches a service that would cut it off.
Result<void> LinuxHostConfigService::storeLocalName(const std::string& name) {
  if (name.empty() || name.size() > longestKernelHostName)
    return Failure{setLocal, staticNameFile, "the kernel holds names of 1 to 64 bytes"};
  const auto stored = staticHostName(_machine.root);
  if (!stored) return stored.failure();
  const auto kernels = kernelHostName(_machine.root);
  if (!kernels) return kernels.failure();
  const auto hosts = hostsOf(_machine.root);
  if (!hosts) return hosts.failure();
  if (auto failure = whyAnnouncingNeedsRoot(name)) return *failure;
  const auto renamed = hostsWithName(*hosts, {stored->value_or(""), kernels->value_or("")}, name);
  if (renamed == *hosts) return storeStaticName(name);
  // Before the name itself: when a run ends in between, setting the name again completes the change.
  if (auto failure = whyNeedsRoot(setLocal, hostsFile)) return *failure;
  if (auto written = _machine.root.write(hostsFile, renamed); !written) return written;
  auto set = storeStaticName(name);
  return set ? set : putBackHosts(*hosts, name, set.failure());
}

/// Where the name was stored all the same it is right among the hosts too.
Failure LinuxHostConfigService::putBackHosts(const std::string& hosts, const std::string& name, Failure cause) {
  if (const auto stored = staticHostName(_machine.root); stored && *stored == name) return cause;
  const auto restored = _machine.root.write(hostsFile, hosts);
  if (!restored) cause.why += "; " + describe(restored.failure());
  return cause;
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
