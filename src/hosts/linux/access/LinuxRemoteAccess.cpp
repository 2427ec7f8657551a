// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/LinuxRemoteAccess.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/services/ServicesConfig.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr const char* sshProgram = "/usr/sbin/sshd";
constexpr const char* sshFolder = "/etc/ssh";
constexpr const char* sshConfig = "/etc/ssh/sshd_config";
// The sessions of the server are processes of the same name: its own is in the file.
constexpr const char* sshProcessFile = "/run/sshd.pid";
constexpr const char* keyMaker = "/usr/bin/ssh-keygen";

std::vector<Daemon> openSshUnits() {
  return {{"ssh.service", "ssh", "sshd", sshProcessFile},
          {"ssh.socket", "", ""},
          {"sshd.service", "sshd", "sshd", sshProcessFile},
          {"sshd.socket", "", ""}};
}

Result<bool> hasHostKey(const SystemRoot& root) {
  const auto isKey = [](const std::string& name) { return name.starts_with("ssh_host_") && name.ends_with("_key"); };
  const auto names = orEmpty(root.list(sshFolder));
  if (!names) return names.failure();
  return std::ranges::any_of(*names, isKey);
}

/// Whether the administrator keeps the keys elsewhere (sshd_config(5)).
Result<bool> namesHostKeys(const SystemRoot& root) {
  const auto names = [](const std::string& line) {
    const auto words = split(line, " \t\r=\"");
    return !words.empty() && lowerCased(words.front()) == "hostkey";
  };
  const auto text = orEmpty(root.read(sshConfig, configurationLimit));
  if (!text) return text.failure();
  return std::ranges::any_of(configurationLines(*text), names);
}

/// Whether the server is another than the one whose keys can be made, or has keys.
Result<bool> needsNoHostKey(const SystemRoot& root) {
  auto isOpenSsh = root.isThere(sshProgram);
  if (!isOpenSsh) return isOpenSsh;
  if (!*isOpenSsh) return true;
  auto has = hasHostKey(root);
  return has && !*has ? namesHostKeys(root) : has;
}

}  // namespace

Result<DaemonGroup> LinuxRemoteShellService::knownServer() {
  auto& daemons = _machine.services.daemons();
  auto units = configuredUnits(_machine.root, "remote-shell");
  if (!units) return units.failure();
  return units->empty() ? DaemonGroup(daemons, openSshUnits()) : DaemonGroup(daemons, std::move(units).value());
}

Result<DaemonGroup> LinuxRemoteShellService::server() {
  const auto known = knownServer();
  return known ? known->present() : known;
}

template <typename Answer, typename Use>
Result<Answer> LinuxRemoteShellService::withServer(Use use) {
  const auto found = server();
  if (!found) return found.failure();
  return use(*found);
}

Support LinuxRemoteShellService::supported() {
  const auto known = knownServer();
  if (!known) return known.failure();
  const auto found = known->present();
  if (!found) return found.failure();
  if (!found->members().empty()) return std::nullopt;
  return std::optional(NotSupported{{"find an SSH server", known->names(), "none of them is installed"}});
}

Result<bool> LinuxRemoteShellService::isOnInAnyWay() {
  return withServer<bool>([](const DaemonGroup& server) -> Result<bool> {
    const auto starting = server.startingAtBoot();
    if (!starting) return starting.failure();
    const auto running = server.running();
    if (!running) return running.failure();
    return !starting->empty() || !running->empty();
  });
}

bool LinuxRemoteShellService::isEnabled() {
  Setting<bool> setting;
  setting.name = setting::remoteLogin;
  setting.live = [this] { return isOnInAnyWay(); };
  return observe(setting, _machine.effects).value_or(false);
}

void LinuxRemoteShellService::setEnabled(bool enabled) {
  Setting<bool> setting;
  setting.name = setting::remoteLogin;
  setting.note = [](bool on) { return on ? "" : "open sessions stay open"; };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return hasAny(&DaemonGroup::running); };
  setting.stored = [this] { return hasAny(&DaemonGroup::startingAtBoot); };
  setting.store = [this](bool on) { return store(on); };
  setting.apply = [this](bool on) { return apply(on); };
  carryOut(setting, enabled, _machine);
}

Result<bool> LinuxRemoteShellService::hasAny(Result<std::vector<Daemon>> (DaemonGroup::*those)() const) {
  return withServer<bool>([those](const DaemonGroup& server) -> Result<bool> {
    const auto found = (server.*those)();
    if (!found) return found.failure();
    return !found->empty();
  });
}

Result<void> LinuxRemoteShellService::store(bool enabled) {
  return withServer<void>([&](const DaemonGroup& server) -> Result<void> {
    if (!enabled) return server.setAllStartAtBoot(false);
    if (auto keys = ensureHostKeys(); !keys) return keys;
    const auto starting = server.startingAtBoot();
    if (!starting) return starting.failure();
    if (!starting->empty()) return {};
    return _machine.services.daemons().setStartAtBoot({server.members().front()}, true);
  });
}

/// Starts what will start with the machine too.
Result<void> LinuxRemoteShellService::apply(bool enabled) {
  return withServer<void>([&](const DaemonGroup& server) -> Result<void> {
    if (!enabled) return server.stopAll();
    const auto running = server.running();
    if (!running) return running.failure();
    if (!running->empty()) return {};
    const auto starting = server.startingAtBoot();
    if (!starting) return starting.failure();
    return _machine.services.daemons().start(starting->empty() ? server.members().front() : starting->front());
  });
}

Result<void> LinuxRemoteShellService::ensureHostKeys() {
  constexpr const char* tried = "make host keys";
  const auto needsNone = needsNoHostKey(_machine.root);
  if (!needsNone) return needsNone.failure();
  if (*needsNone) return {};
  if (auto failure = whyNeedsRoot(tried, sshFolder)) return *failure;
  const auto made = runProgram(_machine.root, {keyMaker, "-A"}, _machine.runLoop);
  if (!made) return made.failure();
  const auto has = hasHostKey(_machine.root);
  if (!has) return has.failure();
  if (*has) return {};
  return Failure{tried, keyMaker, "it reported success, but there is no key in /etc/ssh"};
}

Result<DaemonGroup> LinuxRemoteEventsService::units() {
  auto units = configuredUnits(_machine.root, "remote-events");
  if (!units) return units.failure();
  return DaemonGroup(_machine.services.daemons(), std::move(units).value());
}

Support LinuxRemoteEventsService::supported() {
  constexpr const char* tried = "find units";
  const auto named = units();
  if (!named) return named.failure();
  if (named->members().empty())
    return std::optional(NotSupported{{tried, servicesConfig, "it names none for remote-events"}});
  const auto present = named->present();
  if (!present) return present.failure();
  if (present->members().size() == named->members().size()) return std::nullopt;
  return std::optional(NotSupported{{tried, named->names(), "not all of them are installed"}});
}

Setting<bool>::Found LinuxRemoteEventsService::live() {
  const auto named = units();
  if (!named) return named.failure();
  const auto running = named->running();
  if (!running) return running.failure();
  if (running->empty()) return false;
  const bool isPart = running->size() < named->members().size();
  return Reading<bool>(true, isPart ? "partly on" : "");
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
  Setting<bool> setting;
  setting.name = setting::remoteEvents;
  setting.live = [this] { return isOnInAnyWay(); };
  return observe(setting, _machine.effects).value_or(false);
}

void LinuxRemoteEventsService::setEnabled(bool enabled) {
  Setting<bool> setting;
  setting.name = setting::remoteEvents;
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return startsAtBoot(); };
  setting.store = [this](bool on) {
    const auto named = units();
    return named ? named->setAllStartAtBoot(on) : named.failure();
  };
  setting.apply = [this](bool on) -> Result<void> {
    const auto named = units();
    if (!named) return named.failure();
    return on ? named->startAll() : named->stopAll();
  };
  carryOut(setting, enabled, _machine);
}

}  // namespace tavisk
