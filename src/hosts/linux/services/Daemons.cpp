// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/Daemons.h"

#include <algorithm>
#include <string_view>

#include "hosts/linux/system/CommaList.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr std::string_view socketEnding = ".socket";

bool isSocket(const Daemon& daemon) {
  return std::string_view(daemon.unit).ends_with(socketEnding);
}

/// Whether the one is the socket of the other (systemd.socket(5)).
bool isSocketOf(const Daemon& socket, const Daemon& service) {
  if (!isSocket(socket)) return false;
  const std::string_view name = socket.unit;
  return std::string(name.substr(0, name.size() - socketEnding.size())) + ".service" == service.unit;
}

std::vector<Daemon> socketsFirst(std::vector<Daemon> daemons) {
  std::stable_partition(daemons.begin(), daemons.end(), isSocket);
  return daemons;
}

}  // namespace

Result<Daemons::Presence> Daemons::presence(const Daemon& daemon) {
  const auto found = presences({daemon});
  if (!found) return found.failure();
  return found->front();
}

Result<bool> Daemons::isRunning(const Daemon& daemon) {
  const auto found = areRunning({daemon});
  if (!found) return found.failure();
  return found->front();
}

Result<void> Daemons::checkMayStartAtBoot(const Daemon& daemon, bool start) {
  const auto forRoot = whyNeedsRoot(start ? "enable" : "disable", daemon.unit);
  if (!forRoot) return {};
  const auto starts = startsAtBoot(daemon);
  if (!starts) return starts.failure();
  return *starts == start ? Result<void>() : *forRoot;
}

Result<void> Daemons::checkSetStartAtBoot(const std::vector<Daemon>& daemons, bool start) {
  if (daemons.empty()) return {};
  if (const auto forRoot = whyNeedsRoot(start ? "enable" : "disable", daemons.front().unit)) return *forRoot;
  if (!start) return {};
  const auto found = presences(daemons);
  if (!found) return found.failure();
  const auto masked = std::ranges::find(*found, Presence::masked);
  if (masked == found->end()) return {};
  return Failure{"EnableUnitFiles", daemons[static_cast<std::size_t>(masked - found->begin())].unit, "it is masked"};
}

Result<void> Daemons::foreseeStart(const Daemon& daemon) {
  const auto found = presence(daemon);
  if (!found) return found.failure();
  return *found == Presence::masked ? Result<void>(Failure{"StartUnit", daemon.unit, "it is masked"}) : Result<void>();
}

DaemonGroup::DaemonGroup(Daemons& daemons, std::vector<std::string> units)
    : _daemons(daemons), _units(std::make_shared<const std::vector<std::string>>(std::move(units))) {
  for (const auto& unit : *_units) _members.push_back({unit.c_str(), "", ""});
}

std::string DaemonGroup::names() const {
  std::vector<std::string> units;
  for (const auto& member : _members) units.emplace_back(member.unit);
  return commaList(units);
}

Result<DaemonGroup> DaemonGroup::present() const {
  const auto presences = _daemons.presences(_members);
  if (!presences) return presences.failure();
  auto found = *this;
  found._members.clear();
  for (std::size_t index = 0; index < _members.size(); ++index)
    if ((*presences)[index] != Daemons::Presence::absent) found._members.push_back(_members[index]);
  return found;
}

Result<std::vector<Daemon>> DaemonGroup::those(const std::function<Result<bool>(const Daemon&)>& are) const {
  std::vector<Daemon> found;
  for (const auto& member : _members) {
    const auto is = are(member);
    if (!is) return is.failure();
    if (*is) found.push_back(member);
  }
  return found;
}

Result<std::vector<Daemon>> DaemonGroup::running() const {
  const auto running = _daemons.areRunning(_members);
  if (!running) return running.failure();
  std::vector<Daemon> found;
  for (std::size_t index = 0; index < _members.size(); ++index)
    if ((*running)[index]) found.push_back(_members[index]);
  return found;
}

Result<bool> DaemonGroup::isAnyRunning() const {
  const auto found = running();
  if (!found) return found.failure();
  return !found->empty();
}

Result<bool> DaemonGroup::isAnyStartingAtBoot() const {
  for (const auto& member : _members) {
    auto starts = _daemons.startsAtBoot(member);
    if (!starts || *starts) return starts;
  }
  return false;
}

Result<std::vector<Daemon>> DaemonGroup::startingAtBoot() const {
  return those([this](const Daemon& member) { return _daemons.startsAtBoot(member); });
}

Result<std::vector<Daemon>> DaemonGroup::stayingOffAtBoot() const {
  return those([this](const Daemon& member) { return _daemons.staysOffAtBoot(member); });
}

Result<std::vector<Daemon>> DaemonGroup::ready() const {
  return those([this](const Daemon& member) { return isReady(member); });
}

Result<bool> DaemonGroup::isReady(const Daemon& member) const {
  auto runs = _daemons.isRunning(member);
  if (!runs || *runs) return runs;
  const auto socket = std::ranges::find_if(_members, [&](const Daemon& other) { return isSocketOf(other, member); });
  return socket == _members.end() ? std::move(runs) : _daemons.isRunning(*socket);
}

Result<bool> DaemonGroup::isChanging() const {
  const auto changing = those([this](const Daemon& member) { return _daemons.isChanging(member); });
  if (!changing) return changing.failure();
  return !changing->empty();
}

Result<std::vector<Daemon>> DaemonGroup::toSetAtBoot(bool start) const {
  std::vector<Daemon> others;
  for (const auto& member : _members) {
    const auto starts = _daemons.startsAtBoot(member);
    if (!starts) return starts.failure();
    const auto isLinked = start || *starts ? starts : _daemons.startsUntilRestart(member);
    if (!isLinked) return isLinked.failure();
    if (*isLinked != start) others.push_back(member);
  }
  return others;
}

Result<void> DaemonGroup::setAllStartAtBoot(bool start, WrittenPlaces& written) const {
  const auto others = toSetAtBoot(start);
  if (!others) return others.failure();
  return others->empty() ? Result<void>() : _daemons.setStartAtBoot(*others, start, written);
}

Result<void> DaemonGroup::foreseeStartAll() const {
  for (const auto& member : _members) {
    const auto is = isReady(member);
    if (!is) return is.failure();
    auto started = *is ? Result<void>() : _daemons.foreseeStart(member);
    if (!started) return started;
  }
  return {};
}

Result<void> DaemonGroup::startAll() const {
  for (const auto& member : socketsFirst(_members)) {
    const auto is = isReady(member);
    if (!is) return is.failure();
    if (*is) continue;
    if (auto started = _daemons.start(member); !started) return started;
  }
  return {};
}

Result<void> DaemonGroup::stopAll() const {
  for (const auto& member : socketsFirst({_members.rbegin(), _members.rend()})) {
    const auto runs = _daemons.isRunning(member);
    if (!runs) return runs.failure();
    if (!*runs) continue;
    if (auto stopped = _daemons.stop(member); !stopped) return stopped;
  }
  return {};
}

}  // namespace tavisk
