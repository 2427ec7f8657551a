// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "FakeServiceManager.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include <stdexcept>
#include <utility>

namespace tavisk {
namespace {

constexpr const char* managerPath = "/org/freedesktop/systemd1";
constexpr const char* managerInterface = "org.freedesktop.systemd1.Manager";
constexpr const char* unitFolder = "/org/freedesktop/systemd1/unit/";

int listenAt(const std::filesystem::path& path) {
  std::filesystem::create_directories(path.parent_path());
  int listener = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.string().copy(address.sun_path, sizeof address.sun_path - 1);
  if (::bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 || ::listen(listener, 4) != 0)
    throw std::runtime_error("no socket for the fake service manager");
  return listener;
}

sd_bus* greeted(int connection) {
  sd_bus* bus = nullptr;
  sd_bus_new(&bus);
  sd_bus_set_fd(bus, connection, connection);
  sd_bus_set_server(bus, 1, SD_ID128_MAKE(1, 2, 3, 4, 5, 6, 7, 8, 9, a, b, c, d, e, f, 0));
  sd_bus_start(bus);
  return bus;
}

sd_bus* joined(const std::filesystem::path& socket) {
  sd_bus* bus = nullptr;
  sd_bus_new(&bus);
  sd_bus_set_address(bus, ("unix:path=" + socket.string()).c_str());
  sd_bus_set_bus_client(bus, 1);
  if (sd_bus_start(bus) < 0 || sd_bus_request_name(bus, "org.freedesktop.systemd1", 0) < 0 ||
      sd_bus_request_name(bus, "org.freedesktop.timesync1", 0) < 0)
    throw std::runtime_error("no place on the bus for the fake service manager");
  return bus;
}

std::string firstText(sd_bus_message* message) {
  const char* text = "";
  sd_bus_message_read_basic(message, 's', &text);
  return text;
}

/// Unit names as object paths, without dots and dashes.
std::string pathOf(const std::string& unit) {
  char* path = nullptr;
  sd_bus_path_encode("/org/freedesktop/systemd1/unit", unit.c_str(), &path);
  std::string encoded = path;
  ::free(path);
  return encoded;
}

std::string unitAt(const char* path) {
  char* unit = nullptr;
  if (sd_bus_path_decode(path, "/org/freedesktop/systemd1/unit", &unit) <= 0) return {};
  std::string decoded = unit;
  ::free(unit);
  return decoded;
}

}  // namespace

FakeServiceManager::FakeServiceManager(const std::filesystem::path& socket, Reached reached)
    : _wake(::eventfd(0, EFD_CLOEXEC)) {
  if (reached == Reached::straight) {
    _listener = listenAt(socket);
    _thread = std::thread([this] { serveCallers(); });
  } else {
    _thread = std::thread([this, bus = joined(socket)] { serve(bus); });
  }
}

FakeServiceManager::~FakeServiceManager() {
  ::eventfd_write(_wake, 1);
  _thread.join();
  ::close(_wake);
  ::close(_listener);
}

void FakeServiceManager::set(const std::string& unit, const FakeUnit& state) {
  const std::lock_guard lock(_mutex);
  _units[unit] = state;
}

FakeUnit FakeServiceManager::get(const std::string& unit) {
  const std::lock_guard lock(_mutex);
  return _units[unit];
}

std::vector<std::string> FakeServiceManager::calls() {
  const std::lock_guard lock(_mutex);
  return _calls;
}

void FakeServiceManager::breakNext(const std::string& method, Fault fault) {
  const std::lock_guard lock(_mutex);
  _faults[method] = fault;
}

void FakeServiceManager::serveCallers() {
  pollfd waiting[] = {{_listener, POLLIN, 0}, {_wake, POLLIN, 0}};
  while (::poll(waiting, 2, -1) > 0 && waiting[1].revents == 0) serve(greeted(::accept(_listener, nullptr, nullptr)));
}

void FakeServiceManager::serve(sd_bus* bus) {
  auto filter = [](sd_bus_message* message, void* manager, sd_bus_error* error) {
    return receive(message, manager, error);
  };
  sd_bus_add_filter(bus, nullptr, filter, this);
  _hangUp = false;
  while (!_hangUp && sd_bus_is_open(bus) > 0) {
    int result = sd_bus_process(bus, nullptr);
    if (result < 0) break;
    if (result > 0) continue;
    pollfd waiting[] = {{sd_bus_get_fd(bus), POLLIN, 0}, {_wake, POLLIN, 0}};
    if (::poll(waiting, 2, -1) < 0 || waiting[1].revents != 0) break;
  }
  sd_bus_close_unref(bus);
}

int FakeServiceManager::receive(sd_bus_message* message, void* manager, void* /*error*/) {
  auto* self = static_cast<FakeServiceManager*>(manager);
  const char* member = sd_bus_message_get_member(message);
  if (member == nullptr || sd_bus_message_is_method_call(message, nullptr, nullptr) <= 0) return 0;
  const std::lock_guard lock(self->_mutex);
  auto fault = self->_faults.extract(member);
  return fault ? self->answerFault(message, fault.mapped()) : self->answer(message, member);
}

int FakeServiceManager::answerFault(sd_bus_message* message, Fault fault) {
  switch (fault) {
    case Fault::error:
      return sd_bus_reply_method_errorf(message, SD_BUS_ERROR_ACCESS_DENIED, "not today");
    case Fault::wrongType:
      return sd_bus_reply_method_return(message, "t", std::uint64_t{7});
    case Fault::hangUp:
      _hangUp = true;
      return 1;
    case Fault::silence:
      return 1;
  }
  return 0;
}

int FakeServiceManager::answer(sd_bus_message* message, const std::string& member) {
  if (member == "Get") return answerProperty(message);
  if (member == "GetAll") return answerAllProperties(message);
  if (member == "LoadUnit") return sd_bus_reply_method_return(message, "o", pathOf(firstText(message)).c_str());
  if (member == "GetUnitFileState")
    return sd_bus_reply_method_return(message, "s", _units[firstText(message)].file.c_str());
  if (member == "Reload") {
    _calls.push_back(member);
    return sd_bus_reply_method_return(message, "");
  }
  return member.ends_with("Files") ? answerFiles(message, member) : answerJob(message, member);
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
  if (name == "LoadState") return sd_bus_reply_method_return(message, "v", "s", state.load.c_str());
  if (name == "ActiveState") return sd_bus_reply_method_return(message, "v", "s", state.active.c_str());
  if (name == "ServerName") return sd_bus_reply_method_return(message, "v", "s", "fallback.example");
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
  return enables ? sd_bus_reply_method_return(message, "ba(sss)", 1, 0)
                 : sd_bus_reply_method_return(message, "a(sss)", 0);
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
