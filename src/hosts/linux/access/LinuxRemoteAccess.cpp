// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/LinuxRemoteAccess.h"

#include <algorithm>
#include <functional>
#include <set>
#include <string_view>

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
constexpr const char* makeKeys = "make host keys";
constexpr const char* keyMaker = "/usr/bin/ssh-keygen";
constexpr const char* partlyOn = "partly on";

std::vector<Daemon> openSshUnits() {
  return {{"ssh.service", "ssh", "sshd", sshProcessFile},
          {"ssh.socket", "", ""},
          {"sshd.service", "sshd", "sshd", sshProcessFile},
          {"sshd.socket", "", ""}};
}

using Paths = std::set<std::string>;

/// Private keys, public ones, and what an interrupted maker leaves behind.
Result<Paths> hostKeyFiles(const SystemRoot& root) {
  const auto names = orEmpty(root.list(sshFolder));
  if (!names) return names.failure();
  Paths files;
  for (const auto& name : *names)
    if (name.starts_with("ssh_host_")) files.insert(std::string(sshFolder) + "/" + name);
  return files;
}

bool hasKey(const Paths& files) {
  return std::ranges::any_of(files, [](const std::string& file) { return file.ends_with("_key"); });
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
  const auto files = hostKeyFiles(root);
  if (!files) return files.failure();
  return hasKey(*files) ? true : namesHostKeys(root);
}

using Found = Setting<bool>::Found;

bool isJust(bool on, const Found& found) {
  return found && change::isJust(*found, on);
}

/// Told to the sink as it is found, now and stored.
RemoteAccessState observedState(Setting<bool> setting, EffectSink& effects) {
  const auto live = setting.live();
  auto stored = setting.stored();
  // What is off now may be on after a restart: without the one the other is no answer.
  setting.live = [&] { return isJust(false, live) && !stored ? stored : live; };
  setting.stored = [&] { return stored; };
  const auto observed = observe(setting, effects);
  if (isJust(true, live) && isJust(true, stored)) return RemoteAccessState::on;
  if (observed && !(isJust(false, live) && isJust(false, stored))) return RemoteAccessState::partly;
  const auto support = setting.supported();
  if (support && *support) return RemoteAccessState::unsupported;
  return support && observed ? RemoteAccessState::off : RemoteAccessState::unknown;
}

template <typename Answer, typename Use>
Result<Answer> ask(const Result<DaemonGroup>& daemons, Use use) {
  if (!daemons) return daemons.failure();
  return std::invoke(use, *daemons);
}

Result<bool> hasSettled(const DaemonGroup& daemons) {
  auto changing = daemons.isChanging();
  if (!changing) return changing;
  return !*changing;
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
  return ask<Answer>(server(), use);
}

Support LinuxRemoteShellService::supported() {
  const auto known = knownServer();
  if (!known) return known.failure();
  const auto found = known->present();
  if (!found) return found.failure();
  if (!found->members().empty()) return std::nullopt;
  return std::optional(NotSupported{{"find an SSH server", known->names(), "none of them is installed"}});
}

Setting<bool> LinuxRemoteShellService::remoteLogin() {
  Setting<bool> setting;
  setting.name = setting::remoteLogin;
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return withServer<bool>(&DaemonGroup::isAnyRunning); };
  setting.stored = [this] { return withServer<bool>(&DaemonGroup::isAnyStartingAtBoot); };
  return setting;
}

RemoteAccessState LinuxRemoteShellService::state() {
  const auto found = server();
  auto setting = remoteLogin();
  setting.live = [&] { return ask<bool>(found, &DaemonGroup::isAnyRunning); };
  setting.stored = [&] { return ask<bool>(found, &DaemonGroup::isAnyStartingAtBoot); };
  if (found && _machine.effects.wantsPlaces()) setting.where = found->names();
  return observedState(std::move(setting), _machine.effects);
}

void LinuxRemoteShellService::setEnabled(bool enabled) {
  Trace trace;
  auto setting = remoteLogin();
  setting.note = [&](bool) { return trace.hasStopped ? "open sessions stay open" : ""; };
  setting.written = [&] { return trace.written.text(); };
  setting.check = [this](bool on) { return check(on); };
  setting.foresee = [this](bool on) { return on ? foreseeStart() : Result<void>(); };
  setting.store = [&](bool on) { return store(on, trace); };
  setting.apply = [&](bool on) { return apply(on, trace); };
  setting.settled = [this](bool) { return withServer<bool>(&hasSettled).valueOr(false); };
  carryOut(setting, enabled, _machine);
}

Result<void> LinuxRemoteShellService::store(bool enabled, Trace& trace) {
  if (enabled) {
    if (auto keys = ensureHostKeys(trace); !keys) return keys;
  }
  return withServer<void>([&](const DaemonGroup& server) {
    return enabled ? startAtBoot(server, trace.written) : server.setAllStartAtBoot(false, trace.written);
  });
}

Result<void> LinuxRemoteShellService::startAtBoot(const DaemonGroup& server, WrittenPlaces& written) {
  const auto isStarting = server.isAnyStartingAtBoot();
  if (!isStarting) return isStarting.failure();
  if (*isStarting) return {};
  return _machine.services.daemons().setStartAtBoot({server.members().front()}, true, written);
}

Result<void> LinuxRemoteShellService::check(bool enabled) {
  const auto needsNone = enabled ? needsNoHostKey(_machine.root) : Result<bool>(true);
  if (!needsNone) return needsNone.failure();
  const auto failure = *needsNone ? std::nullopt : whyNeedsRoot(makeKeys, sshFolder);
  if (failure) return *failure;
  return withServer<void>([&](const DaemonGroup& server) -> Result<void> {
    const auto starting = enabled ? server.startingAtBoot() : server.toSetAtBoot(false);
    if (!starting) return starting.failure();
    auto& daemons = _machine.services.daemons();
    if (!enabled) return daemons.checkSetStartAtBoot(*starting, false);
    return starting->empty() ? daemons.checkSetStartAtBoot({server.members().front()}, true) : Result<void>();
  });
}

/// What apply() would start.
Result<void> LinuxRemoteShellService::foreseeStart() {
  return withServer<void>([&](const DaemonGroup& server) -> Result<void> {
    const auto running = server.running();
    if (!running) return running.failure();
    if (!running->empty()) return {};
    const auto starting = server.startingAtBoot();
    if (!starting) return starting.failure();
    return _machine.services.daemons().foreseeStart(starting->empty() ? server.members().front() : starting->front());
  });
}

/// Starts what will start with the machine too.
Result<void> LinuxRemoteShellService::apply(bool enabled, Trace& trace) {
  return withServer<void>([&](const DaemonGroup& server) -> Result<void> {
    const auto running = server.running();
    if (!running) return running.failure();
    trace.hasStopped = !enabled && !running->empty();
    if (!enabled) return server.stopAll();
    if (!running->empty()) return {};
    const auto starting = server.startingAtBoot();
    if (!starting) return starting.failure();
    return _machine.services.daemons().start(starting->empty() ? server.members().front() : starting->front());
  });
}

Result<void> LinuxRemoteShellService::ensureHostKeys(Trace& trace) {
  const auto needsNone = needsNoHostKey(_machine.root);
  if (!needsNone) return needsNone.failure();
  if (*needsNone) return {};
  const auto before = hostKeyFiles(_machine.root);
  if (!before) return before.failure();
  const auto made = runProgram(_machine.root, {keyMaker, "-A"}, _machine.runLoop);
  const auto after = hostKeyFiles(_machine.root);
  for (const auto& file : after.valueOr({}))
    if (!before->contains(file)) trace.written.add(file);
  if (!made) return made.failure();
  if (!after) return after.failure();
  if (hasKey(*after)) return {};
  return Failure{makeKeys, keyMaker, "it reported success, but there is no key in /etc/ssh"};
}

Result<DaemonGroup> LinuxRemoteEventsService::units() {
  auto units = configuredUnits(_machine.root, "remote-events");
  if (!units) return units.failure();
  return DaemonGroup(_machine.services.daemons(), std::move(units).value());
}

template <typename Answer, typename Use>
Result<Answer> LinuxRemoteEventsService::withUnits(Use use) {
  const auto named = units();
  if (!named) return named.failure();
  return use(*named);
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
  const auto ready = named->ready();
  if (!ready) return ready.failure();
  if (ready->empty()) return false;
  return Reading<bool>(true, ready->size() == named->members().size() ? "" : partlyOn);
}

Setting<bool>::Found LinuxRemoteEventsService::stored() {
  const auto named = units();
  if (!named) return named.failure();
  const auto starting = named->startingAtBoot();
  if (!starting) return starting.failure();
  if (starting->empty()) return false;
  const auto stayingOff = named->stayingOffAtBoot();
  if (!stayingOff) return stayingOff.failure();
  const bool startsFirst = starting->front().unit == std::string_view(named->members().front().unit);
  return Reading<bool>(true, startsFirst && stayingOff->empty() ? "" : partlyOn);
}

Setting<bool> LinuxRemoteEventsService::remoteEvents() {
  Setting<bool> setting;
  setting.name = setting::remoteEvents;
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  return setting;
}

RemoteAccessState LinuxRemoteEventsService::state() {
  auto setting = remoteEvents();
  const auto named = _machine.effects.wantsPlaces() ? units() : Failure{};
  if (named) setting.where = named->names();
  return observedState(std::move(setting), _machine.effects);
}

void LinuxRemoteEventsService::setEnabled(bool enabled) {
  WrittenPlaces written;
  auto setting = remoteEvents();
  setting.written = [&] { return written.text(); };
  setting.check = [this](bool on) {
    return withUnits<void>([&](const DaemonGroup& units) -> Result<void> {
      const auto others = units.toSetAtBoot(on);
      return others ? _machine.services.daemons().checkSetStartAtBoot(*others, on) : others.failure();
    });
  };
  setting.store = [&](bool on) {
    return withUnits<void>([&](const DaemonGroup& units) { return units.setAllStartAtBoot(on, written); });
  };
  setting.foresee = [this](bool on) {
    return withUnits<void>([on](const DaemonGroup& units) { return on ? units.foreseeStartAll() : Result<void>(); });
  };
  setting.apply = [this](bool on) {
    return withUnits<void>([on](const DaemonGroup& units) { return on ? units.startAll() : units.stopAll(); });
  };
  setting.settled = [this](bool) { return withUnits<bool>(&hasSettled).valueOr(false); };
  carryOut(setting, enabled, _machine);
}

}  // namespace tavisk
