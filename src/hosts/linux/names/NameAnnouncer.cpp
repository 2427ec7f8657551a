// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/NameAnnouncer.h"

#include <chrono>
#include <cstdint>

#include "hosts/linux/services/SystemServices.h"

namespace tavisk {
namespace {

// avahi-common/defs.h: AVAHI_SERVER_REGISTERING
constexpr std::int32_t registering = 1;
constexpr std::chrono::seconds longestRegistering{3};

BusObject responder() {
  return {"org.freedesktop.Avahi", "/", "org.freedesktop.Avahi.Server"};
}

BusObject resolver() {
  return {"org.freedesktop.resolve1", "/org/freedesktop/resolve1", "org.freedesktop.resolve1.Manager"};
}

BusObject messageBus() {
  return {"org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus"};
}

}  // namespace

Result<Bus*> NameAnnouncer::busOf(const char* service) {
  auto bus = systemBusIfAny(_services);
  if (!bus || !*bus) return bus;
  auto runs = (*bus)->call(messageBus(), "NameHasOwner", "b", service);
  if (!runs) return runs.failure();
  return std::move(runs).value().readBoolean() ? *bus : nullptr;
}

Result<std::optional<std::string>> NameAnnouncer::respondersName() {
  const auto bus = busOf(responder().service);
  if (!bus) return bus.failure();
  if (!*bus) return std::optional<std::string>();
  auto name = (*bus)->call(responder(), "GetHostName", "s");
  if (!name) return name.failure();
  return std::optional(std::move(name).value().readText());
}

Result<std::optional<std::string>> NameAnnouncer::name() {
  auto name = respondersName();
  if (!name || *name) return name;
  const auto bus = busOf(resolver().service);
  if (!bus) return bus.failure();
  if (!*bus) return std::optional<std::string>();
  auto own = (*bus)->property(resolver(), "LLMNRHostname", "s");
  if (!own) return own.failure();
  return std::optional(std::move(own).value().readText());
}

Result<void> NameAnnouncer::announce(const std::string& label) {
  const auto bus = busOf(responder().service);
  if (!bus) return bus.failure();
  if (!*bus) return {};
  std::int32_t state = registering;
  const auto states =
      (*bus)->subscribe(responder(), "StateChanged", [&](BusMessage& signal) { state = signal.readInt32(); });
  if (!states) return states.failure();
  const auto set = (*bus)->call(responder(), "SetHostName", "", label);
  if (!set) return set.failure();
  return awaitRegistered(**bus, state);
}

/// Signals that arrived with a reply do not make the connection readable once more: they are handled before each wait.
Result<void> NameAnnouncer::awaitRegistered(Bus& bus, const std::int32_t& state) {
  const auto watching = _runLoop.watch(bus.descriptor(), RunLoop::Readiness::readable, [] {});
  const auto isRegistered = [&] {
    bus.process();
    return state > registering || !bus.isOpen();
  };
  if (_runLoop.runUntil(RunLoop::Clock::now() + longestRegistering, isRegistered)) return {};
  return Failure{"SetHostName", responder().service, "the name is not registered in time",
                 std::make_error_code(std::errc::timed_out)};
}

Result<bool> NameAnnouncer::hasRegistered() {
  const auto bus = busOf(responder().service);
  if (!bus) return bus.failure();
  if (!*bus) return true;
  auto state = (*bus)->call(responder(), "GetState", "i");
  if (!state) return state.failure();
  return std::move(state).value().readInt32() > registering;
}

}  // namespace tavisk
