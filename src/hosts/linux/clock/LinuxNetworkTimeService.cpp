// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LinuxNetworkTimeService.h"

#include <algorithm>

#include "base/DnsName.h"
#include "effects/SettingNames.h"
#include "hosts/linux/clock/NetworkTimeFacts.h"
#include "hosts/linux/system/CommaList.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr const char* restart = "restart";
constexpr const char* runsUntilRestart =
    "it runs already, so nothing is changed, but it does not start with the machine: type 'tavisk "
    "-setusingnetworktime off -setusingnetworktime on'";
constexpr const char* restsUntilRestart =
    "it is stopped already, so nothing is changed, but it starts with the machine: type 'tavisk "
    "-setusingnetworktime on -setusingnetworktime off'";

Failure noClient() {
  std::vector<std::string> names;
  for (const auto& daemon : timeDaemons()) names.emplace_back(daemon.daemon.unit);
  return {"find a network-time client", commaList(names), "none of them is installed"};
}

/// Empty where there is no client.
std::string unitOf(const Result<const TimeDaemon*>& client) {
  return client && *client ? (*client)->daemon.unit : "";
}

}  // namespace

Daemons& LinuxNetworkTimeService::daemons() {
  return _machine.services.daemons();
}

Result<const TimeDaemon*> LinuxNetworkTimeService::client() {
  std::vector<Daemon> candidates;
  for (const auto& candidate : timeDaemons()) candidates.push_back(candidate.daemon);
  const auto presences = daemons().presences(candidates);
  if (!presences) return presences.failure();
  for (const auto wanted : {Daemons::Presence::installed, Daemons::Presence::masked}) {
    const auto first = std::ranges::find(*presences, wanted);
    if (first != presences->end()) return &timeDaemons()[static_cast<std::size_t>(first - presences->begin())];
  }
  return nullptr;
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

Setting<bool> LinuxNetworkTimeService::runningSetting() {
  auto setting = named<bool>(setting::networkTime);
  setting.live = [this] { return runs(client()); };
  // The other half of the switch, setLaunchAtStartup().
  setting.check = [this](bool isOn) {
    return withClient<void>(
        [&](const TimeDaemon& client) { return daemons().checkMayStartAtBoot(client.daemon, isOn); });
  };
  setting.apply = [this](bool isOn) {
    return withClient<void>([&](const TimeDaemon& client) {
      return isOn ? daemons().start(client.daemon) : daemons().stop(client.daemon);
    });
  };
  setting.foresee = [this](bool isOn) {
    return withClient<void>(
        [&](const TimeDaemon& client) { return isOn ? daemons().foreseeStart(client.daemon) : Result<void>(); });
  };
  setting.settled = [this](bool) {
    const auto isChanging =
        withClient<bool>([this](const TimeDaemon& client) { return daemons().isChanging(client.daemon); });
    return isChanging && !*isChanging;
  };
  return setting;
}

bool LinuxNetworkTimeService::isRunning() {
  const auto found = client();
  auto running = runs(found);
  auto setting = runningSetting();
  setting.live = [&] { return running; };
  setting.stored = [&] { return startsAtBoot(found); };
  if (_machine.effects.wantsPlaces()) setting.where = unitOf(found);
  setting.facts = [&] { return networkTimeFacts(running && *running ? *found : nullptr, _machine); };
  return observe(setting, _machine.effects).value_or(false);
}

void LinuxNetworkTimeService::start() {
  const bool hasStarted = carryOut(runningSetting(), true, _machine).outcome == Outcome::applied;
  _isServerChanged = _isServerChanged && !hasStarted;
}

void LinuxNetworkTimeService::stop() {
  carryOut(runningSetting(), false, _machine);
}

Result<bool> LinuxNetworkTimeService::runs(const Result<const TimeDaemon*>& client) {
  if (!client) return client.failure();
  return *client ? daemons().isRunning((*client)->daemon) : Result<bool>(false);
}

Result<bool> LinuxNetworkTimeService::startsAtBoot(const Result<const TimeDaemon*>& client) {
  if (!client) return client.failure();
  return *client ? daemons().startsAtBoot((*client)->daemon) : Result<bool>(noClient());
}

void LinuxNetworkTimeService::setLaunchAtStartup(bool launch) {
  auto setting = named<bool>(setting::networkTimeAtStartup);
  setting.where = unitOf(client());
  setting.stored = [this] { return startsAtBoot(client()); };
  WrittenPlaces written;
  setting.written = [&] { return written.text(); };
  setting.check = [this](bool starts) {
    return withClient<void>(
        [&](const TimeDaemon& client) { return daemons().checkSetStartAtBoot({client.daemon}, starts); });
  };
  setting.store = [&, this](bool starts) {
    return withClient<void>(
        [&](const TimeDaemon& client) { return daemons().setStartAtBoot({client.daemon}, starts, written); });
  };
  carryOut(setting, launch, _machine);
}

void LinuxNetworkTimeService::checkLaunchAtStartup(bool launch) {
  const auto found = client();
  if (found && !*found) return;
  const auto starts = found ? daemons().startsAtBoot((*found)->daemon) : found.failure();
  if (starts && *starts == launch) return;
  Effect effect{.setting = setting::networkTimeAtStartup, .outcome = Outcome::failed, .asked = textOf(launch)};
  if (starts) {
    effect.before = effect.stored = textOf(*starts);
    effect.failure = {launch ? "enable" : "disable", (*found)->daemon.unit,
                      launch ? runsUntilRestart : restsUntilRestart};
  } else {
    effect.failure = starts.failure();
  }
  _machine.effects.record(effect);
}

Setting<std::string> LinuxNetworkTimeService::serverSetting() {
  auto setting = named<std::string>(setting::networkTimeServer);
  setting.stored = [this] { return firstServer(); };
  return setting;
}

Setting<std::string>::Found LinuxNetworkTimeService::firstServer() {
  const auto found = client();
  if (!found) return found.failure();
  if (!*found) return std::nullopt;
  const auto servers = (*found)->servers(_machine.root);
  if (!servers) return servers.failure();
  return servers->empty() ? std::nullopt : std::optional(Reading(servers->front()));
}

/// The next one that is configured where the first does not answer; else what the network offered, or the client's own
/// last resort.
Setting<std::string>::Found LinuxNetworkTimeService::liveServer() {
  const auto found = client();
  if (!found) return found.failure();
  if (!*found) return std::nullopt;
  const auto runs = daemons().isRunning((*found)->daemon);
  if (!runs) return runs.failure();
  const auto server = *runs ? serverInUse(**found, _machine) : Result<std::string>(std::string());
  if (!server) return server.failure();
  return server->empty() ? std::nullopt : std::optional(Reading(*server));
}

/// What is configured is the answer as soon as it is, whichever server the client is at.
NetworkTimeServer LinuxNetworkTimeService::server() {
  auto setting = named<std::string>(setting::networkTimeServer);
  auto configured = firstServer();
  setting.stored = [&] { return configured; };
  const bool isConfigured = configured && *configured;
  const bool isLiveWanted = configured && (!isConfigured || _machine.effects.wantsValues());
  if (isLiveWanted) setting.live = [this] { return liveServer(); };
  const auto told = observe(setting, _machine.effects);
  return {isConfigured ? (*configured)->value : told.value_or("")};
}

/// The server of the tool's own file, as long as that is written as it is now.
Setting<std::string>::Found LinuxNetworkTimeService::storedServer(const TimeDaemon& client) const {
  const auto servers = client.servers(_machine.root);
  if (!servers) return servers.failure();
  if (servers->empty()) return std::nullopt;
  const auto own = orEmpty(_machine.root.read(client.serverFile, configurationLimit));
  if (!own) return own.failure();
  const auto& first = servers->front();
  const bool isOurs = *own == client.serverLines(first);
  return std::optional(Reading(first, isOurs ? "" : first + ", not as " + client.serverFile + " would have it"));
}

std::string LinuxNetworkTimeService::whatIsConfiguredElsewhere(const TimeDaemon& client,
                                                               const std::string& address) const {
  const auto others = client.otherServers(_machine.root);
  const auto servers = client.servers(_machine.root);
  if (!others || !servers) return {};
  TimeServers aside;
  TimeServers behind;
  for (const auto& other : *others)
    if (other != address) (std::ranges::find(*servers, other) == servers->end() ? aside : behind).push_back(other);
  std::string note = aside.empty() ? "" : "puts aside what is configured elsewhere: " + commaList(aside);
  if (!behind.empty())
    note += (note.empty() ? "" : "; ") + ("configured elsewhere, stays in use behind it: " + commaList(behind));
  return note;
}

void LinuxNetworkTimeService::setServer(const NetworkTimeServer& server) {
  auto setting = serverSetting();
  std::optional<std::string> before;
  if (const auto found = client(); found && *found) {
    const auto* client = *found;
    setting.where = client->serverFile;
    setting.note = [=, this](const auto& address) { return whatIsConfiguredElsewhere(*client, address); };
    if (client->readsServerFile) setting.supported = [=, this] { return client->readsServerFile(_machine.root); };
    setting.stored = [=, this] { return storedServer(*client); };
    setting.takeBack = [=, this, &before] { return putBack(*client, before); };
    setting.store = [=, this, &before](const std::string& address) -> Result<void> {
      const auto lines = orAbsent(_machine.root.read(client->serverFile, configurationLimit));
      if (!lines) return lines.failure();
      before = *lines;
      return _machine.root.write(client->serverFile, client->serverLines(address));
    };
    setting.check = [=](const std::string& address) { return checkServer(*client, address); };
  }
  _isServerChanged = carryOut(setting, server.address, _machine).changed || _isServerChanged;
}

Result<void> LinuxNetworkTimeService::checkServer(const TimeDaemon& client, const std::string& address) {
  constexpr const char* tried = "set the server";
  if (!isHostNameOrAddress(address))
    return Failure{tried, client.serverFile, "only a host name or an address is stored"};
  if (auto failure = whyNeedsRoot(tried, client.serverFile)) return *failure;
  return {};
}

Result<void> LinuxNetworkTimeService::putBack(const TimeDaemon& client, const std::optional<std::string>& lines) {
  return lines ? _machine.root.write(client.serverFile, *lines) : _machine.root.remove(client.serverFile);
}

OwnPart LinuxNetworkTimeService::ownServerFiles() const {
  const auto isThere = [this]() -> Result<bool> {
    for (const auto* file : ownfile::timeServers)
      if (auto there = _machine.root.isThere(file); !there || *there) return there;
    return false;
  };
  const auto takeAway = [this](WrittenPlaces& taken) -> Result<void> {
    for (const auto* file : ownfile::timeServers) {
      const auto there = _machine.root.isThere(file);
      if (!there) return there.failure();
      if (!*there) continue;
      if (auto removed = _machine.root.remove(file); !removed) return removed;
      taken.add(file);
    }
    return {};
  };
  const auto check = [this]() -> Result<void> {
    const auto* const file = std::ranges::find_if(ownfile::timeServers, [this](const auto* path) {
      const auto there = _machine.root.isThere(path);
      return there && *there;
    });
    const bool isKnown = file != std::end(ownfile::timeServers);
    if (auto failure = whyNeedsRoot("remove", isKnown ? *file : "what tavisk stores of it")) return *failure;
    return {};
  };
  return {.isThere = isThere, .check = check, .takeAway = takeAway};
}

void LinuxNetworkTimeService::resetServer() {
  auto setting = serverSetting();
  const ResetMark mark(_machine.root, setting.name);
  setting.own = mark.around(ownServerFiles());
  const auto held = hold(_machine);
  const auto effect = reset(setting, _machine, held);
  _isServerChanged = effect.changed || _isServerChanged;
  if (!_isServerChanged) return;
  const auto running = runs(client());
  const bool mayRun = !running || *running;
  if (mayRun) haveServersRead(held);
  if (!mayRun || !_isServerChanged) unmark(mark, effect, _machine);
}

/// A client that has read its servers as they are goes on undisturbed.
void LinuxNetworkTimeService::restartAsynchronously() {
  const auto isRead = withClient<bool>([this](const TimeDaemon& client) { return hasReadServers(client, _machine); });
  if (isRead && *isRead && !_isServerChanged)
    return _machine.effects.record(
        {.setting = setting::networkTimeRestart, .outcome = Outcome::unchanged, .asked = restart});
  haveServersRead(hold(_machine));
}

void LinuxNetworkTimeService::haveServersRead(const MachineHold& held) {
  auto setting = named<std::string>(setting::networkTimeRestart);
  setting.leavesNoTrace = true;
  setting.apply = [this](const std::string&) {
    return withClient<void>([&](const TimeDaemon& client) { return reload(client); });
  };
  _isServerChanged = carryOut(setting, restart, _machine, held).outcome != Outcome::applied;
}

Result<void> LinuxNetworkTimeService::reload(const TimeDaemon& client) {
  if (client.reload.empty()) return daemons().restartIfRunning(client.daemon);
  if (auto failure = whyNeedsRoot("run", client.reload.front())) return *failure;
  const auto printed = runProgram(_machine.root, {client.reload.begin(), client.reload.end()}, _machine.runLoop);
  if (!printed) return printed.failure();
  return {};
}

}  // namespace tavisk
