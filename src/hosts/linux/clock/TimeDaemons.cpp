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

/// The lines of a file as words: chrony.conf(5) and ntp.conf(5) agree on comments and on one directive a line.
std::vector<std::vector<std::string>> directives(const SystemRoot& root, const std::string& file) {
  std::vector<std::vector<std::string>> found;
  for (const auto& line : configurationLines(root.read(file, configurationLimit).valueOr(""), commentSigns)) {
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

std::string firstServer(const SystemRoot& root, const std::string& file) {
  for (const auto& directive : directives(root, file))
    if (auto server = serverOf(directive); !server.empty()) return server;
  return {};
}

/// The tool's own file aside.
std::string firstServerInFolder(const SystemRoot& root, const std::string& folder, std::string_view ending) {
  for (const auto& name : root.list(folder).valueOr({})) {
    if (!name.ends_with(ending) || name.starts_with(std::string(ownfile::name) + ".")) continue;
    if (auto server = firstServer(root, (folder + "/").append(name)); !server.empty()) return server;
  }
  return {};
}

/// As chronyd reads its configuration: "confdir" and "sourcedir" lines take in the files of folders.
std::string chronyOtherServer(const SystemRoot& root) {
  for (const auto& directive : directives(root, chronyConfig)) {
    auto server = serverOf(directive);
    for (std::size_t i = 1; i < directive.size() && server.empty(); ++i) {
      if (directive[0] == "confdir") server = firstServerInFolder(root, directive[i], ".conf");
      if (directive[0] == "sourcedir") server = firstServerInFolder(root, directive[i], ".sources");
    }
    if (!server.empty()) return server;
  }
  return {};
}

std::optional<Failure> chronyWhyNotRead(const SystemRoot& root) {
  const auto readsOwnFile = [](const std::vector<std::string>& directive) {
    return directive[0] == "sourcedir" && std::ranges::find(directive, "/etc/chrony/sources.d") != directive.end();
  };
  if (std::ranges::any_of(directives(root, chronyConfig), readsOwnFile)) return std::nullopt;
  return Failure{
      "set the server", ownfile::chronyServer,
      "chronyd does not read it: " + std::string(chronyConfig) + " has no line \"sourcedir /etc/chrony/sources.d\""};
}

std::string ntpsecOtherServer(const SystemRoot& root) {
  auto server = firstServer(root, ntpsecConfig);
  return server.empty() ? firstServerInFolder(root, "/etc/ntpsec/ntp.d", ".conf") : server;
}

std::string chronyServer(const SystemRoot& root) {
  auto own = chronyWhyNotRead(root) ? std::string() : firstServer(root, ownfile::chronyServer);
  return own.empty() ? chronyOtherServer(root) : own;
}

std::string ntpsecServer(const SystemRoot& root) {
  auto own = firstServer(root, ownfile::ntpsecServer);
  return own.empty() ? ntpsecOtherServer(root) : own;
}

std::string openntpdServer(const SystemRoot& root) {
  return firstServer(root, openntpdConfig);
}

std::optional<Failure> openntpdWhyNotRead(const SystemRoot&) {
  return Failure{"set the server", openntpdConfig, "openntpd reads this file only, and it is the administrator's"};
}

std::string timesyncdServer(const SystemRoot& root) {
  const auto servers = SystemdConfig(root, "timesyncd.conf").words("Time", "NTP").valueOr({});
  return servers.empty() ? std::string() : servers.front();
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
     .whyNotRead = chronyWhyNotRead,
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
     .whyNotRead = openntpdWhyNotRead},
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
