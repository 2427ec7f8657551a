// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/SystemServices.h"

#include <chrono>

namespace tavisk {
namespace {

constexpr const char* managerService = "org.freedesktop.systemd1";
constexpr std::chrono::seconds longestReload{10};

}  // namespace

BusObject serviceManager() {
  return {managerService, "/org/freedesktop/systemd1", "org.freedesktop.systemd1.Manager"};
}

BusObject unitAt(const std::string& path) {
  return {managerService, path, "org.freedesktop.systemd1.Unit"};
}

BusObject loginManager() {
  return {"org.freedesktop.login1", "/org/freedesktop/login1", "org.freedesktop.login1.Manager"};
}

Result<Bus*> systemBusIfAny(ServiceAccess& services) {
  if (!services.hasServiceManager()) return nullptr;
  auto bus = services.systemBus();
  if (bus || (!isAbsent(bus.failure()) && bus.failure().code != std::errc::connection_refused)) return bus;
  return nullptr;
}

Result<void> reloadServiceManager(ServiceAccess& services) {
  const auto bus = services.serviceManager();
  if (!bus) return bus.failure();
  const auto reloaded = (*bus)->call(serviceManager(), "Reload", "", Bus::Writer([](BusMessage&) {}), longestReload);
  if (!reloaded) return reloaded.failure();
  return {};
}

}  // namespace tavisk
