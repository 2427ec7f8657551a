// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/InitScriptDaemons.h"

#include <algorithm>
#include <chrono>
#include <iterator>
#include <string_view>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/system/ProcessHandle.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

// Debian's run level of a started machine (init(8)).
constexpr const char* levelFolder = "/etc/rc2.d";
constexpr std::string_view runLevels = "0123456S";
constexpr const char* linkTool = "/usr/sbin/update-rc.d";
constexpr std::chrono::seconds longestStart{3};
constexpr std::chrono::seconds longestStop{3};
constexpr std::chrono::milliseconds betweenLooks{20};
constexpr std::size_t processFileLimit = 64;

std::string scriptOf(const Daemon& daemon) {
  return std::string("/etc/init.d/") + daemon.script;
}

/// The program may still come to it.
Failure outOfTime(const char* tried, const Daemon& daemon, const char* state) {
  return {tried, scriptOf(daemon), std::string("it reported success, but ") + daemon.program + state,
          std::make_error_code(std::errc::timed_out)};
}

/// "S01chrony": the kind, two digits, the script.
bool isLinkTo(std::string_view script, std::string_view kinds, std::string_view link) {
  return link.size() == script.size() + 3 && kinds.find(link[0]) != std::string_view::npos && link.ends_with(script);
}

std::vector<std::string> differing(const std::set<std::string>& before, const std::set<std::string>& after) {
  std::vector<std::string> links;
  std::ranges::set_symmetric_difference(before, after, std::back_inserter(links));
  return links;
}

}  // namespace

Result<std::vector<Daemons::Presence>> InitScriptDaemons::presences(const std::vector<Daemon>& daemons) {
  std::vector<Presence> found;
  for (const auto& daemon : daemons) {
    const auto hasScript = *daemon.script == '\0' ? Result<bool>(false) : _root.isThere(scriptOf(daemon));
    const auto isInstalled = hasScript && *hasScript ? hasProgram(daemon) : hasScript;
    if (!isInstalled) return isInstalled.failure();
    found.push_back(*isInstalled ? Presence::installed : Presence::absent);
  }
  return found;
}

/// A package that was removed, but not purged, leaves its script behind.
Result<bool> InitScriptDaemons::hasProgram(const Daemon& daemon) const {
  auto there = _root.isThere(std::string("/usr/sbin/") + daemon.program);
  if (!there || *there) return there;
  return _root.isThere(std::string("/usr/bin/") + daemon.program);
}

Result<std::vector<ProcessId>> InitScriptDaemons::processes(const Daemon& daemon) const {
  auto found = processesNamed(_root, daemon.program);
  if (!found || *daemon.processFile == '\0') return found;
  const auto written = orEmpty(_root.read(daemon.processFile, processFileLimit));
  if (!written) return written.failure();
  auto own = std::move(found).value();
  std::erase_if(own, [id = leadingInteger(*written)](ProcessId process) { return process != id; });
  return own;
}

Result<std::vector<bool>> InitScriptDaemons::areRunning(const std::vector<Daemon>& daemons) {
  std::vector<bool> are;
  for (const auto& daemon : daemons) {
    const auto found = processes(daemon);
    if (!found) return found.failure();
    are.push_back(!found->empty());
  }
  return are;
}

Result<bool> InitScriptDaemons::hasLink(const Daemon& daemon, const char* kinds) const {
  const auto links = orEmpty(_root.list(levelFolder));
  if (!links) return links.failure();
  return std::ranges::any_of(*links, [&](const auto& link) { return isLinkTo(daemon.script, kinds, link); });
}

Result<bool> InitScriptDaemons::startsAtBoot(const Daemon& daemon) {
  return hasLink(daemon, "S");
}

Result<bool> InitScriptDaemons::staysOffAtBoot(const Daemon& daemon) {
  auto starts = startsAtBoot(daemon);
  if (!starts) return starts;
  return !*starts;
}

Result<std::set<std::string>> InitScriptDaemons::linksTo(const Daemon& daemon) const {
  std::set<std::string> links;
  for (const char level : runLevels) {
    const auto folder = std::string("/etc/rc") + level + ".d";
    const auto names = orEmpty(_root.list(folder));
    if (!names) return names.failure();
    for (const auto& name : *names)
      if (isLinkTo(daemon.script, "SK", name)) links.insert(std::string(folder).append("/").append(name));
  }
  return links;
}

Result<void> InitScriptDaemons::setStartAtBoot(const std::vector<Daemon>& daemons, bool start, WrittenPlaces& written) {
  for (const auto& daemon : daemons) {
    const auto before = linksTo(daemon);
    if (!before) return before.failure();
    auto turned = turnLinks(daemon, start);
    for (const auto& link : differing(*before, linksTo(daemon).valueOr(*before))) written.add(link);
    if (!turned) return turned;
  }
  return {};
}

Result<void> InitScriptDaemons::turnLinks(const Daemon& daemon, bool starts) {
  // "enable" and "disable" turn links round; there must be some.
  const auto isLinked = hasLink(daemon, "SK");
  if (!isLinked) return isLinked.failure();
  if (!*isLinked)
    if (auto made = run({linkTool, daemon.script, "defaults"}); !made) return made;
  return run({linkTool, daemon.script, starts ? "enable" : "disable"});
}

Result<void> InitScriptDaemons::start(const Daemon& daemon) {
  if (auto started = runScript(daemon, "start"); !started) return started;
  return awaitBeginning(daemon);
}

Result<void> InitScriptDaemons::stop(const Daemon& daemon) {
  if (auto stopped = runScript(daemon, "stop"); !stopped) return stopped;
  return awaitEnd(daemon);
}

/// A daemon may write the file with its process id after its script has ended.
Result<void> InitScriptDaemons::awaitBeginning(const Daemon& daemon) {
  auto running = isRunning(daemon);
  const auto runs = [&] { return !(running = isRunning(daemon)) || *running; };
  const auto looking = _runLoop.every(betweenLooks, [] {});
  if (*daemon.processFile != '\0') static_cast<void>(_runLoop.runUntil(RunLoop::Clock::now() + longestStart, runs));
  if (!running) return running.failure();
  if (*running) return {};
  return outOfTime("start", daemon, " does not run");
}

/// The script may have sent a signal and not waited.
Result<void> InitScriptDaemons::awaitEnd(const Daemon& daemon) {
  const auto ending = processes(daemon);
  if (!ending) return ending.failure();
  std::vector<ProcessHandle> handles;
  std::vector<RunLoop::Registration> watches;
  for (const auto process : *ending) {
    auto handle = ProcessHandle::of(process);
    if (!handle && handle.failure().code == std::errc::no_such_process) continue;  // it has ended since
    if (!handle) return handle.failure();
    handles.push_back(std::move(handle).value());
    const auto stopLooking = [&watches, index = watches.size()] { watches[index].cancel(); };
    watches.push_back(_runLoop.watch(handles.back().descriptor(), RunLoop::Readiness::readable, stopLooking));
  }
  auto running = isRunning(daemon);
  const auto isGone = [&] { return !(running = isRunning(daemon)) || !*running; };
  static_cast<void>(_runLoop.runUntil(RunLoop::Clock::now() + longestStop, isGone));
  if (!running) return running.failure();
  if (!*running) return {};
  return outOfTime("stop", daemon, " still runs");
}

Result<void> InitScriptDaemons::restart(const Daemon& daemon) {
  return runScript(daemon, "restart");
}

Result<void> InitScriptDaemons::restartIfRunning(const Daemon& daemon) {
  const auto running = isRunning(daemon);
  if (!running) return running.failure();
  if (!*running) return {};
  return runScript(daemon, "restart");
}

Result<void> InitScriptDaemons::runScript(const Daemon& daemon, const char* action) {
  return run({scriptOf(daemon), action});
}

Result<void> InitScriptDaemons::run(const std::vector<std::string>& words) {
  if (auto failure = whyNeedsRoot("run", words.front())) return *failure;
  const auto printed = runProgram(_root, words, _runLoop);
  if (!printed) return printed.failure();
  return {};
}

}  // namespace tavisk
