// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/TimeDaemons.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* chronyConfig = "/etc/chrony/chrony.conf";
constexpr const char* ntpsecConfig = "/etc/ntpsec/ntp.conf";
constexpr const char* openntpdConfig = "/etc/openntpd/ntpd.conf";
constexpr const char* chronyReload[] = {"/usr/bin/chronyc", "reload", "sources"};
constexpr std::string_view commentSigns = "#%;!";

using Directives = std::vector<std::vector<std::string>>;
using Server = Result<std::string>;

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

/// Whether a search is over: a server is found, or something cannot be looked at.
bool isOver(const Server& server) {
  return !server || !server->empty();
}

Server firstServer(const SystemRoot& root, const std::string& file) {
  const auto found = directives(root, file);
  if (!found) return found.failure();
  for (const auto& directive : *found)
    if (auto server = serverOf(directive); !server.empty()) return server;
  return std::string();
}

/// The tool's own file aside.
Server firstServerInFolder(const SystemRoot& root, const std::string& folder, std::string_view ending) {
  const auto names = orEmpty(root.list(folder));
  if (!names) return names.failure();
  for (const auto& name : *names) {
    if (!name.ends_with(ending) || name.starts_with(std::string(ownfile::name) + ".")) continue;
    if (auto server = firstServer(root, (folder + "/").append(name)); isOver(server)) return server;
  }
  return std::string();
}

/// As chronyd reads its configuration: "confdir" and "sourcedir" lines take in the files of folders.
Server chronyOtherServer(const SystemRoot& root) {
  const auto found = directives(root, chronyConfig);
  if (!found) return found.failure();
  for (const auto& directive : *found) {
    Server server = serverOf(directive);
    for (std::size_t i = 1; i < directive.size() && !isOver(server); ++i) {
      if (directive[0] == "confdir") server = firstServerInFolder(root, directive[i], ".conf");
      if (directive[0] == "sourcedir") server = firstServerInFolder(root, directive[i], ".sources");
    }
    if (isOver(server)) return server;
  }
  return std::string();
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

Server ntpsecOtherServer(const SystemRoot& root) {
  auto server = firstServer(root, ntpsecConfig);
  return isOver(server) ? server : firstServerInFolder(root, "/etc/ntpsec/ntp.d", ".conf");
}

Server chronyServer(const SystemRoot& root) {
  const auto reads = chronyReadsServerFile(root);
  if (!reads) return reads.failure();
  auto own = *reads ? Server(std::string()) : firstServer(root, ownfile::chronyServer);
  return isOver(own) ? own : chronyOtherServer(root);
}

Server ntpsecServer(const SystemRoot& root) {
  auto own = firstServer(root, ownfile::ntpsecServer);
  return isOver(own) ? own : ntpsecOtherServer(root);
}

Server openntpdServer(const SystemRoot& root) {
  return firstServer(root, openntpdConfig);
}

Support openntpdReadsServerFile(const SystemRoot&) {
  return std::optional(
      NotSupported{{"set the server", openntpdConfig, "openntpd reads this file only, and it is the administrator's"}});
}

Server timesyncdServer(const SystemRoot& root) {
  const auto servers = SystemdConfig(root, "timesyncd.conf").words("Time", "NTP");
  if (!servers) return servers.failure();
  return servers->empty() ? std::string() : servers->front();
}

std::string serverDirective(const std::string& server) {
  return ownfile::header + ("server " + server) + " iburst\n";
}

/// The empty assignment takes the place of servers in files before this one.
std::string timesyncdLines(const std::string& server) {
  return ownfile::header + ("[Time]\nNTP=\nNTP=" + server) + "\n";
}

constexpr TimeDaemon daemons[] = {
    {.daemon = {"chrony.service", "chrony", "chronyd"},
     .serverFile = ownfile::chronyServer,
     .server = chronyServer,
     .otherServer = chronyOtherServer,
     .serverLines = serverDirective,
     .readsServerFile = chronyReadsServerFile,
     .reload = chronyReload},
    {.daemon = {"ntpsec.service", "ntpsec", "ntpd"},
     .serverFile = ownfile::ntpsecServer,
     .server = ntpsecServer,
     .otherServer = ntpsecOtherServer,
     .serverLines = serverDirective},
    {.daemon = {"openntpd.service", "openntpd", "ntpd"},
     .serverFile = openntpdConfig,
     .server = openntpdServer,
     .serverLines = serverDirective,
     .readsServerFile = openntpdReadsServerFile},
    {.daemon = {"systemd-timesyncd.service", "", "systemd-timesyncd"},
     .serverFile = ownfile::timesyncdServer,
     .server = timesyncdServer,
     .serverLines = timesyncdLines,
     .busService = "org.freedesktop.timesync1"},
};

}  // namespace

std::span<const TimeDaemon> timeDaemons() {
  return daemons;
}

}  // namespace tavisk
