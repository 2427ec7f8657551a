// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LinuxNetworkTimeService.h"

#include "base/DnsName.h"
#include "effects/SettingNames.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

using Value = std::optional<std::string>;

Failure noClient() {
  std::string names;
  for (const auto& daemon : timeDaemons()) names += (names.empty() ? "" : ", ") + std::string(daemon.daemon.unit);
  return {"find a network-time client", names, "none of them is installed"};
}

}  // namespace

Daemons& LinuxNetworkTimeService::daemons() {
  return _machine.services.daemons();
}

Result<const TimeDaemon*> LinuxNetworkTimeService::client() {
  const TimeDaemon* masked = nullptr;
  for (const auto& candidate : timeDaemons()) {
    const auto presence = daemons().presence(candidate.daemon);
    if (!presence) return presence.failure();
    if (*presence == Daemons::Presence::installed) return &candidate;
    if (*presence == Daemons::Presence::masked && !masked) masked = &candidate;
  }
  return masked;
}

template <typename Answer, typename Use>
Result<Answer> LinuxNetworkTimeService::withClient(Use use) {
  const auto found = client();
  if (!found) return found.failure();
  if (!*found) return noClient();
  return use(**found);
}

Support LinuxNetworkTimeService::isSupported() {
  const auto found = client();
  if (!found) return found.failure();
  if (*found) return std::nullopt;
  return std::optional(NotSupported{noClient()});
}

template <typename Value>
Setting<Value> LinuxNetworkTimeService::named(const char* name) {
  Setting<Value> setting;
  setting.name = name;
  setting.supported = [this] { return isSupported(); };
  return setting;
}

template <typename Value>
void LinuxNetworkTimeService::change(const Setting<Value>& setting, const std::type_identity_t<Value>& asked) {
  carryOut(setting, asked, _machine);
}

Setting<bool> LinuxNetworkTimeService::runningSetting() {
  auto setting = named<bool>(setting::networkTime);
  setting.live = [this]() -> Result<bool> {
    const auto found = client();
    if (!found) return found.failure();
    return *found ? daemons().isRunning((*found)->daemon) : Result<bool>(false);
  };
  setting.apply = [this](bool isOn) {
    return withClient<void>([&](const TimeDaemon& client) { return run(client.daemon, isOn); });
  };
  return setting;
}

Result<void> LinuxNetworkTimeService::run(const Daemon& daemon, bool isOn) {
  // The other half of the switch, setLaunchAtStartup().
  if (auto may = daemons().checkMayStartAtBoot(daemon, isOn); !may) return may;
  return isOn ? daemons().start(daemon) : daemons().stop(daemon);
}

bool LinuxNetworkTimeService::isRunning() {
  return observe(runningSetting(), _machine.effects).value_or(false);
}

void LinuxNetworkTimeService::start() {
  change(runningSetting(), true);
}

void LinuxNetworkTimeService::stop() {
  change(runningSetting(), false);
}

void LinuxNetworkTimeService::setLaunchAtStartup(bool launch) {
  auto setting = named<bool>(setting::networkTimeAtStartup);
  setting.stored = [this] {
    return withClient<bool>([this](const TimeDaemon& client) { return daemons().startsAtBoot(client.daemon); });
  };
  setting.store = [this](bool starts) {
    return withClient<void>(
        [&](const TimeDaemon& client) { return daemons().setStartAtBoot({client.daemon}, starts); });
  };
  change(setting, launch);
}

Setting<std::string> LinuxNetworkTimeService::serverSetting() {
  auto setting = named<std::string>(setting::networkTimeServer);
  setting.stored = [this]() -> Result<Value> {
    const auto found = client();
    if (!found) return found.failure();
    if (!*found) return Value();
    return (*found)->server(_machine.root);
  };
  return setting;
}

Result<std::string> LinuxNetworkTimeService::serverInUseWithoutAny() {
  const auto found = client();
  if (!found) return found.failure();
  if (!*found || !(*found)->busService) return std::string();
  const auto configured = (*found)->server(_machine.root);
  if (!configured) return configured.failure();
  const auto runs = configured->empty() ? daemons().isRunning((*found)->daemon) : Result<bool>(false);
  if (!runs) return runs.failure();
  return *runs ? serverInUse((*found)->busService) : std::string();
}

/// A server that the network offered, or the daemon's own last resort.
Result<std::string> LinuxNetworkTimeService::serverInUse(const char* busService) {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return std::string();
  const BusObject manager{busService, "/org/freedesktop/timesync1", "org.freedesktop.timesync1.Manager"};
  auto name = (*bus)->property(manager, "ServerName", "s");
  if (name) return std::move(name).value().readText();
  if (name.failure().code == BusErrorCode::serviceUnknown) return std::string();
  return name.failure();
}

NetworkTimeServer LinuxNetworkTimeService::server() {
  auto setting = serverSetting();
  auto inUse = serverInUseWithoutAny();
  if (!inUse || !inUse->empty()) setting.live = [&inUse] { return inUse; };
  return {observe(setting, _machine.effects).value_or("")};
}

std::string LinuxNetworkTimeService::whatStaysInUse(const TimeDaemon& client) const {
  const auto other = client.otherServer ? client.otherServer(_machine.root) : std::string();
  return !other || other->empty() ? "" : "configured elsewhere, " + *other + " stays in use beside it";
}

void LinuxNetworkTimeService::setServer(const NetworkTimeServer& server) {
  auto setting = serverSetting();
  if (const auto found = client(); found && *found) {
    setting.where = (*found)->serverFile;
    setting.note = [this, client = *found](const auto&) { return whatStaysInUse(*client); };
    if ((*found)->readsServerFile)
      setting.supported = [this, client = *found] { return client->readsServerFile(_machine.root); };
  }
  setting.store = [this](const std::string& address) {
    return withClient<void>([&](const TimeDaemon& client) { return storeServer(client, address); });
  };
  change(setting, server.address);
}

Result<void> LinuxNetworkTimeService::storeServer(const TimeDaemon& client, const std::string& address) {
  constexpr const char* tried = "set the server";
  if (!isHostNameOrAddress(address))
    return Failure{tried, client.serverFile, "only a host name or an address is stored"};
  if (auto failure = whyNeedsRoot(tried, client.serverFile)) return *failure;
  return _machine.root.write(client.serverFile, client.serverLines(address));
}

void LinuxNetworkTimeService::restartAsynchronously() {
  auto setting = named<std::string>(setting::networkTimeRestart);
  setting.apply = [this](const std::string&) {
    return withClient<void>([&](const TimeDaemon& client) { return reload(client); });
  };
  change(setting, "restart");
}

Result<void> LinuxNetworkTimeService::reload(const TimeDaemon& client) {
  if (client.reload.empty()) return daemons().restartIfRunning(client.daemon);
  if (auto failure = whyNeedsRoot("run", client.reload.front())) return *failure;
  const auto printed = runProgram(_machine.root, {client.reload.begin(), client.reload.end()}, _machine.runLoop);
  if (!printed) return printed.failure();
  return {};
}

}  // namespace tavisk
