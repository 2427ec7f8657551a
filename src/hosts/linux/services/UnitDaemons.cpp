// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/UnitDaemons.h"

#include <algorithm>
#include <chrono>
#include <iterator>
#include <map>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/services/ServiceAccess.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/services/UnitFiles.h"
#include "hosts/linux/system/CommaList.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr const char* enabledUntilRestart = "enabled-runtime";
constexpr const char* notFound = "not-found";
constexpr std::chrono::seconds longestJob{3};

/// What failed was asked about this unit, not about the manager as a whole.
Failure about(const Daemon& daemon, const Failure& failure) {
  return retold(failure, failure.tried, daemon.unit);
}

/// "ConditionVirtualization=!container", the first condition that does not hold; empty when all do.
std::string firstUnmet(BusMessage& conditions) {
  std::string unmet;
  if (!conditions.enter('a', "(sbbsi)")) return unmet;
  while (unmet.empty() && conditions.enter('r', "sbbsi")) {
    auto name = conditions.readText();
    const bool isTrigger = conditions.readBoolean();
    const bool isNegated = conditions.readBoolean();
    const auto parameter = conditions.readText();
    if (conditions.readInt32() < 0)
      unmet = std::move(name).append("=").append(isTrigger ? "|" : "").append(isNegated ? "!" : "").append(parameter);
    conditions.exit();
  }
  return unmet;
}

Failure notRunning(const Daemon& daemon, const std::string& unmet) {
  const auto reason = unmet.empty() ? "" : ": the condition " + unmet + " does not hold";
  return {"StartUnit", daemon.unit, "its job is done, but the unit does not run" + reason};
}

/// Of what systemd-analyze(1) prints, "NAME.service: ConditionVirtualization=!container failed."; empty: it names none.
std::string unmetConditionIn(const std::string& printed) {
  constexpr std::string_view ending = " failed.";
  for (const auto& line : split(printed, "\n")) {
    const auto start = line.find("Condition");
    if (start == std::string::npos || !line.ends_with(ending) || line.find('=', start) == std::string::npos) continue;
    return line.substr(start, line.size() - ending.size() - start);
  }
  return {};
}

/// Notes the jobs that end (the manager's signal JobRemoved) from its beginning on.
class EndedJobs {
 public:
  Result<void> listen(Bus& bus) {
    auto subscription = bus.subscribe(serviceManager(), "JobRemoved", [this](BusMessage& signal) { note(signal); });
    if (!subscription) return subscription.failure();
    _subscription = std::move(subscription).value();
    return {};
  }
  /// "done", or what else became of the job; null while it has not ended.
  const std::string* resultOf(const std::string& job) const {
    const auto ended = _results.find(job);
    return ended == _results.end() ? nullptr : &ended->second;
  }

 private:
  void note(BusMessage& signal) {
    signal.readUint32();
    const auto job = signal.readText();
    signal.readText();
    const auto result = signal.readText();
    if (!signal.error()) _results[job] = result;
  }

  std::map<std::string, std::string> _results;
  std::unique_ptr<Bus::Subscription> _subscription;
};

/// Of the manager's list of changes, at which the reply is: (kind, link, what it leads to). Of other kinds nothing was
/// written.
void addLinks(BusMessage& changes, WrittenPlaces& written) {
  if (!changes.enter('a', "(sss)")) return;
  while (changes.enter('r', "sss")) {
    const auto kind = changes.readText();
    const auto link = changes.readText();
    changes.readText();
    if (kind == "symlink" || kind == "unlink") written.add(link);
    changes.exit();
  }
}

/// While it is started anew it stops first: its job tells what it comes to.
bool isToRun(const UnitState& state) {
  const auto& [load, active, job] = state;
  return active == "active" || active == "activating" || active == "reloading" || job == "start" || job == "restart";
}

/// One unit of the manager's list: name, description, both states, more of both, and the job that it has.
std::pair<std::string, UnitState> takeState(BusMessage& list) {
  auto name = list.readText();
  list.readText();
  UnitState state{list.readText(), list.readText(), ""};
  for (int more = 0; more < 3; ++more) list.readText();
  list.readUint32();
  state.job = list.readText();
  list.readText();
  list.exit();
  return {std::move(name), std::move(state)};
}

}  // namespace

Result<BusMessage> UnitDaemons::ask(const Daemon& daemon, const char* member, const char* replySignature) {
  const auto bus = _services.serviceManager();
  if (!bus) return bus.failure();
  auto reply = (*bus)->call(serviceManager(), member, replySignature, daemon.unit);
  if (!reply) return about(daemon, reply.failure());
  return reply;
}

template <typename... Arguments>
Result<BusMessage> UnitDaemons::order(const Daemon& daemon, const char* member, const char* replySignature,
                                      const Arguments&... arguments) {
  const auto bus = _services.serviceManager();
  if (!bus) return bus.failure();
  auto reply = (*bus)->call(serviceManager(), member, replySignature, arguments...);
  if (!reply) return about(daemon, reply.failure());
  return reply;
}

Result<BusMessage> UnitDaemons::unitProperty(const Daemon& daemon, const char* name, const char* signature) {
  auto unit = ask(daemon, "LoadUnit", "o");
  if (!unit) return unit.failure();
  const auto bus = _services.serviceManager();
  if (!bus) return bus.failure();
  auto value = (*bus)->property(unitAt(std::move(unit).value().readText()), name, signature);
  if (!value) return about(daemon, value.failure());
  return value;
}

/// What the manager tells of units when it is asked so, by their own names.
template <typename... Arguments>
Result<std::vector<UnitDaemons::NamedState>> UnitDaemons::listed(const char* member,
                                                                 const std::vector<std::string>& units,
                                                                 const Arguments&... arguments) {
  const auto bus = _services.serviceManager();
  if (!bus) return bus.failure();
  auto reply = (*bus)->call(serviceManager(), member, "a(ssssssouso)", arguments..., units);
  if (!reply) return retold(reply.failure(), member, commaList(units));
  auto list = std::move(reply).value();
  std::vector<NamedState> states;
  list.enter('a', "(ssssssouso)");
  while (list.enter('r', "ssssssouso")) states.push_back(takeState(list));
  return states;
}

/// To look for a unit that does not exist costs the manager more than all else: by their names it is asked only for
/// units that have a file, of those that it has not loaded, has not found so far or knows by another name. Where this
/// user cannot look for files, the manager can.
Result<std::vector<UnitState>> UnitDaemons::states(const std::vector<Daemon>& daemons) {
  std::vector<std::string> units;
  std::ranges::transform(daemons, std::back_inserter(units), &Daemon::unit);
  const auto loaded = listed("ListUnitsByPatterns", units, std::vector<std::string>());
  if (!loaded) return loaded.failure();
  std::map<std::string, UnitState> states(loaded->begin(), loaded->end());

  auto rest = units;
  std::erase_if(rest, [&](const auto& unit) {
    const auto known = states.find(unit);
    return known != states.end() && known->second.load != notFound;
  });
  const auto installed = unitsWithFiles(_root, rest).valueOr(rest);
  const auto named = installed.empty() ? Result<std::vector<NamedState>>(std::vector<NamedState>())
                                       : listed("ListUnitsByNames", installed);
  if (!named) return named.failure();
  if (named->size() != installed.size())
    return Failure{"ListUnitsByNames", commaList(installed), "it does not tell of each of them"};
  for (std::size_t place = 0; place < named->size(); ++place) states[installed[place]] = (*named)[place].second;

  std::vector<UnitState> inOrder;
  std::ranges::transform(units, std::back_inserter(inOrder), [&](const auto& unit) {
    return states.try_emplace(unit, UnitState{notFound, "inactive", ""}).first->second;
  });
  return inOrder;
}

/// A unit whose file can no longer be understood is there: it may run still, and be enabled.
Result<std::vector<Daemons::Presence>> UnitDaemons::presences(const std::vector<Daemon>& daemons) {
  const auto found = states(daemons);
  if (!found) return found.failure();
  std::vector<Presence> presences;
  for (const auto& state : *found)
    presences.push_back(state.load == "masked"   ? Presence::masked
                        : state.load == notFound ? Presence::absent
                                                 : Presence::installed);
  return presences;
}

Result<std::vector<bool>> UnitDaemons::areRunning(const std::vector<Daemon>& daemons) {
  const auto found = states(daemons);
  if (!found) return found.failure();
  std::vector<bool> are;
  std::ranges::transform(*found, std::back_inserter(are), isToRun);
  return are;
}

Result<bool> UnitDaemons::isChanging(const Daemon& daemon) {
  const auto found = states({daemon});
  if (!found) return found.failure();
  const auto& active = found->front().active;
  return active == "activating" || active == "deactivating";
}

Result<std::string> UnitDaemons::fileState(const Daemon& daemon) {
  auto state = ask(daemon, "GetUnitFileState", "s");
  if (state) return std::move(state).value().readText();
  if (state.failure().code == BusErrorCode::fileNotFound) return std::string();
  return state.failure();
}

Result<bool> UnitDaemons::startsAtBoot(const Daemon& daemon) {
  if (isEnabledBeyondDoubt(_root, daemon.unit)) return true;
  const auto state = fileState(daemon);
  if (!state) return state.failure();
  return *state == "enabled";
}

Result<bool> UnitDaemons::startsUntilRestart(const Daemon& daemon) {
  const auto state = fileState(daemon);
  if (!state) return state.failure();
  return *state == enabledUntilRestart;
}

Result<bool> UnitDaemons::staysOffAtBoot(const Daemon& daemon) {
  const auto state = fileState(daemon);
  if (!state) return state.failure();
  return *state == "disabled" || *state == enabledUntilRestart;
}

/// Reads the unit files once for all of them, also when one could not be changed.
Result<void> UnitDaemons::setStartAtBoot(const std::vector<Daemon>& daemons, bool start, WrittenPlaces& written) {
  // There is no leave for single units: who may change one unit file may change all of them.
  if (const auto forRoot = whyNeedsRoot(start ? "enable" : "disable", daemons.empty() ? "" : daemons.front().unit))
    return *forRoot;
  Result<void> last;
  bool isAnyChanged = false;
  for (const auto& daemon : daemons) {
    last = changeLinks(daemon, start, written);
    if (!last) break;
    isAnyChanged = true;
  }
  if (!isAnyChanged) return last;
  auto reloaded = reloadServiceManager(_services);
  return last ? reloaded : last;
}

Result<void> UnitDaemons::changeLinks(const Daemon& daemon, bool start, WrittenPlaces& written) {
  const std::vector<std::string> files{daemon.unit};
  constexpr bool replaceLinks = false;
  const auto state = fileState(daemon);
  if (!state) return state.failure();
  const bool untilRestart = !start && *state == enabledUntilRestart;
  auto changed = start ? order(daemon, "EnableUnitFiles", "ba(sss)", files, untilRestart, replaceLinks)
                       : order(daemon, "DisableUnitFiles", "a(sss)", files, untilRestart);
  if (!changed) return changed.failure();
  auto changes = std::move(changed).value();
  if (start) changes.readBoolean();
  addLinks(changes, written);
  return {};
}

Result<void> UnitDaemons::runJob(const Daemon& daemon, const char* method) {
  const auto bus = _services.serviceManager();
  if (!bus) return bus.failure();
  EndedJobs ended;
  if (auto listens = ended.listen(**bus); !listens) return listens;
  auto reply = (*bus)->call(serviceManager(), method, "o", daemon.unit, "replace");
  if (!reply) return about(daemon, reply.failure());
  const auto job = std::move(reply).value().readText();

  const auto watching = _runLoop.watch((*bus)->descriptor(), RunLoop::Readiness::readable, [] {});
  const auto hasEnded = [&] {
    (*bus)->process();
    return ended.resultOf(job) || !(*bus)->isOpen();
  };
  if (!_runLoop.runUntil(RunLoop::Clock::now() + longestJob, hasEnded))
    return Failure{method, daemon.unit, "its job has not ended in time", std::make_error_code(std::errc::timed_out)};
  const auto* result = ended.resultOf(job);
  if (!result) return Failure{method, daemon.unit, "the connection to the service manager ended"};
  if (*result == "done") return {};
  return Failure{method, daemon.unit, "its job ended with: " + *result};
}

/// A job can be "done" and the unit not run: a condition of it may not hold, as in a container.
Failure UnitDaemons::whyNotRunning(const Daemon& daemon) {
  return notRunning(daemon, unmetCondition(daemon).value_or(""));
}

std::optional<std::string> UnitDaemons::unmetCondition(const Daemon& daemon) {
  auto holds = unitProperty(daemon, "ConditionResult", "b");
  if (!holds || std::move(holds).value().readBoolean()) return std::nullopt;
  auto conditions = unitProperty(daemon, "Conditions", "a(sbbsi)");
  if (!conditions) return std::nullopt;
  auto list = std::move(conditions).value();
  return firstUnmet(list);
}

Result<void> UnitDaemons::start(const Daemon& daemon) {
  if (auto started = runJob(daemon, "StartUnit"); !started) return started;
  const auto running = isRunning(daemon);
  if (!running) return running.failure();
  if (!*running) return whyNotRunning(daemon);
  return {};
}

/// The service manager tells of conditions only what they were when it last tried: a program of it asks them anew.
Result<void> UnitDaemons::foreseeStart(const Daemon& daemon) {
  constexpr const char* asker = "/usr/bin/systemd-analyze";
  if (auto known = Daemons::foreseeStart(daemon); !known) return known;
  const auto isThere = _root.isThere(asker);
  if (!isThere || !*isThere) return {};
  const auto asked = outputOfProgram(_root, {asker, "condition", std::string("--unit=") + daemon.unit}, _runLoop);
  if (!asked || asked->exitStatus == 0) return {};
  const auto unmet = unmetConditionIn(asked->text);
  return unmet.empty() ? Result<void>() : Result<void>(notRunning(daemon, unmet));
}

Result<void> UnitDaemons::stop(const Daemon& daemon) {
  return runJob(daemon, "StopUnit");
}

Result<void> UnitDaemons::restart(const Daemon& daemon) {
  return runJob(daemon, "RestartUnit");
}

Result<void> UnitDaemons::restartIfRunning(const Daemon& daemon) {
  const auto job = order(daemon, "TryRestartUnit", "o", daemon.unit, "replace");
  if (!job) return job.failure();
  return {};
}

}  // namespace tavisk
