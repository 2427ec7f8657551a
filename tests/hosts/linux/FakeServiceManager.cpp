// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/FakeServiceManager.h"

#include <systemd/sd-bus.h>

#include <cstdlib>
#include <thread>

namespace tavisk {
namespace {

constexpr const char* managerPath = "/org/freedesktop/systemd1";
constexpr const char* managerInterface = "org.freedesktop.systemd1.Manager";
const std::vector<std::string> names = {"org.freedesktop.systemd1", "org.freedesktop.timesync1"};
constexpr const char* unitFolder = "/org/freedesktop/systemd1/unit";

/// Unit names as object paths, without dots and dashes.
std::string pathOf(const std::string& unit) {
  char* path = nullptr;
  sd_bus_path_encode(unitFolder, unit.c_str(), &path);
  std::string encoded = path;
  ::free(path);
  return encoded;
}

std::string unitAt(const char* path) {
  char* unit = nullptr;
  if (sd_bus_path_decode(path, unitFolder, &unit) <= 0) return {};
  std::string decoded = unit;
  ::free(unit);
  return decoded;
}

}  // namespace

FakeServiceManager::FakeServiceManager(const std::filesystem::path& socket, Reached reached)
    : _peer(socket, reached == Reached::overBus ? names : std::vector<std::string>(),
            [this](sd_bus_message* call, const std::string& member) { return receive(call, member); }) {}

void FakeServiceManager::set(const std::string& unit, const FakeUnit& state) {
  const std::scoped_lock lock(_mutex);
  _units[unit] = state;
}

FakeUnit FakeServiceManager::get(const std::string& unit) {
  const std::scoped_lock lock(_mutex);
  return _units[unit];
}

std::vector<std::string> FakeServiceManager::calls() {
  const std::scoped_lock lock(_mutex);
  return _calls;
}

void FakeServiceManager::breakNext(const std::string& method, Fault fault) {
  const std::scoped_lock lock(_mutex);
  _faults[method] = fault;
}

int FakeServiceManager::receive(sd_bus_message* message, const std::string& member) {
  const std::scoped_lock lock(_mutex);
  auto fault = _faults.extract(member);
  return fault ? answerFault(message, fault.mapped()) : answer(message, member);
}

int FakeServiceManager::answerFault(sd_bus_message* message, Fault fault) {
  switch (fault) {
    case Fault::error:
      return sd_bus_reply_method_errorf(message, SD_BUS_ERROR_ACCESS_DENIED, "not today");
    case Fault::question:
      return sd_bus_reply_method_errorf(message, SD_BUS_ERROR_INTERACTIVE_AUTHORIZATION_REQUIRED, "a password");
    case Fault::wrongType:
      return sd_bus_reply_method_return(message, "t", std::uint64_t{7});
    case Fault::hangUp:
      _peer.hangUp();
      return 1;
    case Fault::silence:
      return 1;
  }
  return 0;
}

int FakeServiceManager::answer(sd_bus_message* message, const std::string& member) {
  if (member == "Get") return answerProperty(message);
  if (member == "GetAll") return answerAllProperties(message);
  if (member == "ListUnitsByNames") return answerUnits(message, true);
  if (member == "ListUnitsByPatterns") {
    sd_bus_message_skip(message, "as");  // states
    return answerUnits(message, false);
  }
  if (member == "LoadUnit") return sd_bus_reply_method_return(message, "o", pathOf(firstText(message)).c_str());
  if (member == "GetUnitFileState")
    return sd_bus_reply_method_return(message, "s", _units[firstText(message)].file.c_str());
  if (member == "Reload") {
    _calls.push_back(member);
    return sd_bus_reply_method_return(message, "");
  }
  return member.ends_with("Files") ? answerFiles(message, member) : answerJob(message, member);
}

int FakeServiceManager::answerUnits(sd_bus_message* message, bool loads) {
  sd_bus_message* reply = nullptr;
  sd_bus_message_new_method_return(message, &reply);
  sd_bus_message_open_container(reply, 'a', "(ssssssouso)");
  sd_bus_message_enter_container(message, 'a', "s");
  const char* unit = nullptr;
  while (sd_bus_message_read_basic(message, 's', &unit) > 0) {
    const auto known = _units.find(unit);
    if (known == _units.end() && !loads) continue;
    const auto state = known == _units.end() ? FakeUnit{"not-found"} : known->second;
    std::this_thread::sleep_for(state.delay);
    sd_bus_message_append(reply, "(ssssssouso)", unit, "", state.load.c_str(), state.active.c_str(), "", "",
                          pathOf(unit).c_str(), state.job.empty() ? 0U : 1U, state.job.c_str(), "/");
  }
  sd_bus_message_close_container(reply);
  const int sent = sd_bus_send(nullptr, reply, nullptr);
  sd_bus_message_unref(reply);
  return sent < 0 ? sent : 1;
}

FakeUnit FakeServiceManager::unitOf(sd_bus_message* message) {
  auto known = _units.find(unitAt(sd_bus_message_get_path(message)));
  return known == _units.end() ? FakeUnit{"not-found"} : known->second;
}

int FakeServiceManager::answerAllProperties(sd_bus_message* message) {
  const auto state = unitOf(message);
  return sd_bus_reply_method_return(message, "a{sv}", 3, "LoadState", "s", state.load.c_str(), "ActiveState", "s",
                                    state.active.c_str(), "UnitFileState", "s", state.file.c_str());
}

int FakeServiceManager::answerProperty(sd_bus_message* message) {
  const auto state = unitOf(message);
  firstText(message);
  const auto name = firstText(message);
  if (name == "ServerName") return sd_bus_reply_method_return(message, "v", "s", "fallback.example");
  // 1 ms each way, and 1 ms between: the clock is 1.5 ms behind.
  if (name == "NTPMessage")
    return sd_bus_reply_method_return(message, "v", "(uuuuittayttttbtt)", 0U, 4U, 4U, 1U, -20, std::uint64_t{0},
                                      std::uint64_t{0}, 4, 192, 0, 2, 7, std::uint64_t{1'000'000},
                                      std::uint64_t{1'002'500}, std::uint64_t{1'003'500}, std::uint64_t{1'003'000}, 0,
                                      std::uint64_t{7}, std::uint64_t{0});
  if (name == "SystemNTPServers") return sd_bus_reply_method_return(message, "v", "as", 1, "time.example");
  if (name == "ConditionResult") return sd_bus_reply_method_return(message, "v", "b", state.conditionHolds ? 1 : 0);
  return sd_bus_reply_method_return(message, "v", "a(sbbsi)", 2, "ConditionCapability", 0, 0, "CAP_SYS_TIME", 1,
                                    "ConditionVirtualization", 0, 1, "container", -1);
}

int FakeServiceManager::answerFiles(sd_bus_message* message, const std::string& member) {
  sd_bus_message_enter_container(message, 'a', "s");
  const auto unit = firstText(message);
  _calls.push_back(member + " " + unit);
  const bool enables = member == "EnableUnitFiles";
  _units[unit].file = enables ? "enabled" : "disabled";
  const auto link = linkOf(unit);
  return enables ? sd_bus_reply_method_return(message, "ba(sss)", 1, 2, "symlink", link.c_str(), "", "masked", "x", "")
                 : sd_bus_reply_method_return(message, "a(sss)", 1, "unlink", link.c_str(), "");
}

int FakeServiceManager::answerJob(sd_bus_message* message, const std::string& member) {
  const auto unit = firstText(message);
  _calls.push_back(member + " " + unit);
  auto& state = _units[unit];
  const auto job = "/org/freedesktop/systemd1/job/" + std::to_string(++_jobs);
  sd_bus_reply_method_return(message, "o", job.c_str());
  if (state.jobResult.empty()) return 1;
  if (state.jobResult == "done" && state.conditionHolds && member != "TryRestartUnit")
    state.active = member == "StartUnit" ? "active" : "inactive";
  return sd_bus_emit_signal(sd_bus_message_get_bus(message), managerPath, managerInterface, "JobRemoved", "uoss", _jobs,
                            job.c_str(), unit.c_str(), state.jobResult.c_str());
}

}  // namespace tavisk
