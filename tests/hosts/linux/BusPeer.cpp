// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/BusPeer.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace tavisk {
namespace {

sd_bus* greeted(int connection) {
  sd_bus* bus = nullptr;
  sd_bus_new(&bus);
  sd_bus_set_fd(bus, connection, connection);
  sd_bus_set_server(bus, 1, SD_ID128_MAKE(1, 2, 3, 4, 5, 6, 7, 8, 9, a, b, c, d, e, f, 0));
  sd_bus_start(bus);
  return bus;
}

sd_bus* joined(const std::filesystem::path& socket, const std::vector<std::string>& names) {
  sd_bus* bus = nullptr;
  sd_bus_new(&bus);
  sd_bus_set_address(bus, ("unix:path=" + socket.string()).c_str());
  sd_bus_set_bus_client(bus, 1);
  const auto owns = [&](const std::string& name) { return sd_bus_request_name(bus, name.c_str(), 0) >= 0; };
  if (sd_bus_start(bus) < 0 || !std::ranges::all_of(names, owns))
    throw std::runtime_error("no place on the bus for a fake service");
  return bus;
}

}  // namespace

FileDescriptor socketAt(const std::filesystem::path& path, int type) {
  std::filesystem::create_directories(path.parent_path());
  FileDescriptor socket(::socket(AF_UNIX, type | SOCK_CLOEXEC, 0));
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.string().copy(address.sun_path, sizeof address.sun_path - 1);
  if (::bind(socket.number(), reinterpret_cast<sockaddr*>(&address), sizeof address) != 0)
    throw std::runtime_error("no socket for a fake service");
  return socket;
}

std::string firstText(sd_bus_message* message) {
  const char* text = "";
  sd_bus_message_read_basic(message, 's', &text);
  return text;
}

BusPeer::BusPeer(const std::filesystem::path& socket, const std::vector<std::string>& namesOnBus, Answer answer)
    : _wake(::eventfd(0, EFD_CLOEXEC)), _answer(std::move(answer)) {
  if (namesOnBus.empty()) {
    _listener = socketAt(socket, SOCK_STREAM);
    ::listen(_listener.number(), 4);
    _thread = std::thread([this] { serveCallers(); });
  } else {
    _thread = std::thread([this, bus = joined(socket, namesOnBus)] { serve(bus); });
  }
}

BusPeer::~BusPeer() {
  ::eventfd_write(_wake.number(), 1);
  _thread.join();
}

void BusPeer::serveCallers() {
  pollfd waiting[] = {{_listener.number(), POLLIN, 0}, {_wake.number(), POLLIN, 0}};
  while (::poll(waiting, 2, -1) > 0 && waiting[1].revents == 0)
    serve(greeted(::accept(_listener.number(), nullptr, nullptr)));
}

void BusPeer::serve(sd_bus* bus) {
  auto filter = [](sd_bus_message* message, void* peer, sd_bus_error* error) { return receive(message, peer, error); };
  sd_bus_add_filter(bus, nullptr, filter, this);
  _hangUp = false;
  while (!_hangUp && sd_bus_is_open(bus) > 0) {
    int result = sd_bus_process(bus, nullptr);
    if (result < 0) break;
    if (result > 0) continue;
    pollfd waiting[] = {{sd_bus_get_fd(bus), POLLIN, 0}, {_wake.number(), POLLIN, 0}};
    if (::poll(waiting, 2, -1) < 0 || waiting[1].revents != 0) break;
  }
  sd_bus_close_unref(bus);
}

int BusPeer::receive(sd_bus_message* message, void* peer, void* /*error*/) {
  auto* self = static_cast<BusPeer*>(peer);
  const char* member = sd_bus_message_get_member(message);
  if (!member || sd_bus_message_is_method_call(message, nullptr, nullptr) <= 0) return 0;
  // What connections ask of the message bus itself.
  if (std::string(member) == "Hello") return sd_bus_reply_method_return(message, "s", ":1.1");
  if (std::string(member).ends_with("Match")) return sd_bus_reply_method_return(message, "");
  return self->_answer(message, member);
}

}  // namespace tavisk
