// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/TimeDaemons.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <string_view>
#include <utility>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* chronyConfig = "/etc/chrony/chrony.conf";
constexpr const char* ntpsecConfig = "/etc/ntpsec/ntp.conf";
constexpr const char* openntpdConfig = "/etc/openntpd/ntpd.conf";
constexpr const char* chronyReload[] = {"/usr/bin/chronyc", "reload", "sources"};
constexpr const char* chronySources[] = {"/usr/bin/chronyc", "-N", "-c", "sources", "-a"};
constexpr std::string_view commentSigns = "#%;!";
constexpr const char* exchangeTypes = "uuuuittayttttbtt";
constexpr const char* exchangeSignature = "(uuuuittayttttbtt)";

using Directives = std::vector<std::vector<std::string>>;
using Servers = Result<TimeServers>;

/// The lines of a file as words: chrony.conf(5) and ntp.conf(5) agree on comments and on one directive a line. Without
/// the file there are none.
Result<Directives> directives(const SystemRoot& root, const std::string& file) {
  const auto text = orEmpty(root.read(file, configurationLimit));
  if (!text) return text.failure();
  Directives found;
  for (const auto& line : configurationLines(*text, commentSigns)) {
    auto words = split(line, " \t\r");
    words[0] = lowerCased(words[0]);
    found.push_back(std::move(words));
  }
  return found;
}

/// The server that a directive names; empty when it names none.
std::string serverOf(const std::vector<std::string>& directive) {
  constexpr std::string_view kinds[] = {"server", "servers", "pool", "peer"};
  if (directive.size() < 2 || std::ranges::find(kinds, directive[0]) == std::end(kinds)) return {};
  return directive[1];
}

void append(TimeServers& servers, const TimeServers& more) {
  servers.insert(servers.end(), more.begin(), more.end());
}

/// What is configured in one place and in the next.
Servers both(Servers first, const Servers& second) {
  if (!first || !second) return first ? second : first;
  auto all = std::move(first).value();
  append(all, *second);
  return all;
}

Servers serversIn(const SystemRoot& root, const std::string& file) {
  const auto found = directives(root, file);
  if (!found) return found.failure();
  TimeServers servers;
  for (const auto& directive : *found)
    if (auto server = serverOf(directive); !server.empty()) servers.push_back(std::move(server));
  return servers;
}

/// The tool's own file aside.
Servers serversInFolder(const SystemRoot& root, const std::string& folder, std::string_view ending) {
  const auto names = orEmpty(root.list(folder));
  if (!names) return names.failure();
  Servers servers = TimeServers();
  for (const auto& name : *names)
    if (name.ends_with(ending) && !name.starts_with(std::string(ownfile::name) + "."))
      servers = both(std::move(servers), serversIn(root, (folder + "/").append(name)));
  return servers;
}

/// As chronyd reads its configuration: "confdir" and "sourcedir" lines take in the files of folders.
Servers chronyOtherServers(const SystemRoot& root) {
  const auto found = directives(root, chronyConfig);
  if (!found) return found.failure();
  Servers servers = TimeServers();
  for (const auto& directive : *found) {
    if (auto server = serverOf(directive); !server.empty()) servers = both(std::move(servers), TimeServers{server});
    for (std::size_t i = 1; i < directive.size(); ++i) {
      if (directive[0] == "confdir") servers = both(std::move(servers), serversInFolder(root, directive[i], ".conf"));
      if (directive[0] == "sourcedir")
        servers = both(std::move(servers), serversInFolder(root, directive[i], ".sources"));
    }
  }
  return servers;
}

Support chronyReadsServerFile(const SystemRoot& root) {
  const auto found = directives(root, chronyConfig);
  if (!found) return found.failure();
  const auto readsOwnFile = [](const std::vector<std::string>& directive) {
    return directive[0] == "sourcedir" && std::ranges::find(directive, "/etc/chrony/sources.d") != directive.end();
  };
  if (std::ranges::any_of(*found, readsOwnFile)) return std::nullopt;
  return std::optional(NotSupported{
      {"set the server", ownfile::chronyServer,
       "chronyd does not read it: " + std::string(chronyConfig) + " has no line \"sourcedir /etc/chrony/sources.d\""}});
}

Servers ntpsecOtherServers(const SystemRoot& root) {
  return both(serversIn(root, ntpsecConfig), serversInFolder(root, "/etc/ntpsec/ntp.d", ".conf"));
}

Servers chronyServers(const SystemRoot& root) {
  const auto reads = chronyReadsServerFile(root);
  if (!reads) return reads.failure();
  return both(*reads ? Servers(TimeServers()) : serversIn(root, ownfile::chronyServer), chronyOtherServers(root));
}

Servers ntpsecServers(const SystemRoot& root) {
  return both(serversIn(root, ownfile::ntpsecServer), ntpsecOtherServers(root));
}

Servers openntpdServers(const SystemRoot& root) {
  return serversIn(root, openntpdConfig);
}

Support openntpdReadsServerFile(const SystemRoot&) {
  return std::optional(
      NotSupported{{"set the server", openntpdConfig, "openntpd reads this file only, and it is the administrator's"}});
}

Servers timesyncdServers(const SystemRoot& root) {
  return SystemdConfig(root, "timesyncd.conf").words("Time", "NTP");
}

Servers timesyncdOtherServers(const SystemRoot& root) {
  return SystemdConfig(root, "timesyncd.conf").wordsBesideOwn("Time", "NTP");
}

std::string serverDirective(const std::string& server) {
  return ownfile::header + ("server " + server) + " iburst prefer\n";
}

/// The empty assignment takes the place of servers in files before this one.
std::string timesyncdLines(const std::string& server) {
  return ownfile::header + ("[Time]\nNTP=\nNTP=" + server) + "\n";
}

constexpr TimeDaemon daemons[] = {
    {.daemon = {"chrony.service", "chrony", "chronyd"},
     .serverFile = ownfile::chronyServer,
     .servers = chronyServers,
     .otherServers = chronyOtherServers,
     .serverLines = serverDirective,
     .readsServerFile = chronyReadsServerFile,
     .reload = chronyReload,
     .sources = chronySources},
    {.daemon = {"ntpsec.service", "ntpsec", "ntpd"},
     .serverFile = ownfile::ntpsecServer,
     .servers = ntpsecServers,
     .otherServers = ntpsecOtherServers,
     .serverLines = serverDirective,
     .startFile = "/run/ntpd.pid"},
    {.daemon = {"openntpd.service", "openntpd", "ntpd"},
     .serverFile = openntpdConfig,
     .servers = openntpdServers,
     .otherServers = openntpdServers,
     .serverLines = serverDirective,
     .readsServerFile = openntpdReadsServerFile},
    {.daemon = {"systemd-timesyncd.service", "", "systemd-timesyncd"},
     .serverFile = ownfile::timesyncdServer,
     .servers = timesyncdServers,
     .otherServers = timesyncdOtherServers,
     .serverLines = timesyncdLines,
     .busService = "org.freedesktop.timesync1"},
};

BusObject timeSyncManager(const char* busService) {
  return {busService, "/org/freedesktop/timesync1", "org.freedesktop.timesync1.Manager"};
}

/// As the daemon that tells them keeps them.
TimeServers onceEach(const TimeServers& servers) {
  TimeServers kept;
  for (const auto& server : servers)
    if (std::ranges::find(kept, server) == kept.end()) kept.push_back(server);
  return kept;
}

/// Against all servers: a file of the administrator's may have changed too.
Result<bool> tellsItsServers(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto configured = daemon.servers(machine.root);
  if (!configured) return configured.failure();
  const auto bus = machine.services.systemBus();
  if (!bus) return bus.failure();
  auto told = (*bus)->property(timeSyncManager(daemon.busService), "SystemNTPServers", "as");
  if (!told) return told.failure();
  return std::move(told).value().readTexts() == onceEach(*configured);
}

using Fields = std::vector<std::string>;
using Ahead = Result<std::optional<std::chrono::microseconds>>;

/// The printed lines that tell a server.
Result<std::vector<Fields>> printedSources(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto printed = runProgram(machine.root, {daemon.sources.begin(), daemon.sources.end()}, machine.runLoop);
  if (!printed) return printed.failure();
  std::vector<Fields> sources;
  for (const auto& line : split(*printed, "\n"))
    if (auto fields = split(line, ","); fields.size() > 2) sources.push_back(std::move(fields));
  return sources;
}

Result<bool> printsItsServer(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto own = serversIn(machine.root, daemon.serverFile);
  if (!own) return own.failure();
  const auto sources = printedSources(daemon, machine);
  if (!sources) return sources.failure();
  const auto isKnown = [&](const std::string& server) {
    return std::ranges::any_of(*sources, [&](const Fields& fields) { return fields[2] == server; });
  };
  return std::ranges::all_of(*own, isKnown);
}

std::optional<std::chrono::microseconds> asSpan(std::string_view seconds) {
  constexpr double longest = 1e9;  // more than any clock is off; and it stays a number of microseconds
  const auto number = parseReal(seconds);
  if (!number || !(std::abs(*number) < longest)) return std::nullopt;
  return std::chrono::round<std::chrono::microseconds>(std::chrono::duration<double>(*number));
}

Result<TimeSource> printedSourceInUse(const TimeDaemon& daemon, const LinuxMachine& machine) {
  constexpr std::size_t ahead = 7;
  const auto sources = printedSources(daemon, machine);
  if (!sources) return sources.failure();
  const auto used = std::ranges::find_if(*sources, [](const Fields& fields) { return fields[1] == "*"; });
  if (used == sources->end()) return TimeSource();
  return TimeSource{(*used)[2], used->size() > ahead ? asSpan((*used)[ahead]) : std::nullopt};
}

/// By the times of a question and its answer: sent, received, answered, back (org.freedesktop.timesync1(5),
/// NTPMessage; RFC 5905, section 8). Absent while there is none.
std::optional<std::chrono::microseconds> aheadAt(BusMessage exchange) {
  if (!exchange.enter('r', exchangeTypes)) return std::nullopt;
  exchange.skip("uuuuittay");
  const auto sent = exchange.readUint64();
  const auto received = exchange.readUint64();
  const auto answered = exchange.readUint64();
  const auto back = exchange.readUint64();
  exchange.skip("b");
  const auto answers = exchange.readUint64();
  const auto twiceAhead = static_cast<std::int64_t>((sent - received) + (back - answered));
  return answers == 0 || exchange.error() ? std::nullopt : std::optional(std::chrono::microseconds(twiceAhead / 2));
}

Result<bool> hasStartedSince(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto started = machine.root.stamp(daemon.startFile);
  if (!started) return Failure{"look at", daemon.startFile, "it does not tell when the client started"};
  const auto written = machine.root.stamp(daemon.serverFile);
  return !written || written->changed < started->modified;
}

Ahead lastAhead(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto bus = machine.services.systemBus();
  if (!bus) return bus.failure();
  auto exchange = (*bus)->property(timeSyncManager(daemon.busService), "NTPMessage", exchangeSignature);
  if (!exchange) return exchange.failure();
  return aheadAt(std::move(exchange).value());
}

}  // namespace

std::span<const TimeDaemon> timeDaemons() {
  return daemons;
}

Result<bool> hasReadServers(const TimeDaemon& daemon, const LinuxMachine& machine) {
  const auto reads = daemon.readsServerFile ? daemon.readsServerFile(machine.root) : Support(std::nullopt);
  if (!reads) return reads.failure();
  if (*reads) return true;
  if (daemon.busService) return tellsItsServers(daemon, machine);
  if (!daemon.sources.empty()) return printsItsServer(daemon, machine);
  return hasStartedSince(daemon, machine);
}

Result<std::string> serverInUse(const TimeDaemon& daemon, const LinuxMachine& machine) {
  if (!daemon.sources.empty()) {
    auto source = printedSourceInUse(daemon, machine);
    return source ? Result<std::string>(std::move(source).value().server) : source.failure();
  }
  if (!daemon.busService) return std::string();
  const auto bus = systemBusIfAny(machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return std::string();
  auto name = (*bus)->property(timeSyncManager(daemon.busService), "ServerName", "s");
  if (name) return std::move(name).value().readText();
  if (name.failure().code == BusErrorCode::serviceUnknown) return std::string();
  return name.failure();
}

Result<TimeSource> sourceInUse(const TimeDaemon& daemon, const LinuxMachine& machine) {
  if (!daemon.sources.empty()) return printedSourceInUse(daemon, machine);
  auto server = serverInUse(daemon, machine);
  if (!server) return server.failure();
  if (server->empty()) return TimeSource();
  return TimeSource{std::move(server).value(), lastAhead(daemon, machine)};
}

}  // namespace tavisk
