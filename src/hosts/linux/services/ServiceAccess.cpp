// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/ServiceAccess.h"

#include <cerrno>
#include <chrono>

namespace tavisk {
namespace {

constexpr const char* managerMark = "/run/systemd/system/";
constexpr std::chrono::seconds slow{1};

}  // namespace

Result<bool> ServiceAccess::lookForManager() {
  const auto now = RunLoop::Clock::now();
  if (_lookFailure && now - _lookedAt < Bus::timeWithoutRetry) return *_lookFailure;
  _lookFailure.reset();
  auto there = _root.isThere(managerMark);
  if (!there) _lookFailure = there.failure();
  _lookedAt = now;
  return there;
}

bool ServiceAccess::hasServiceManager() {
  return lookForManager().valueOr(true);
}

Result<const SystemdLibrary*> ServiceAccess::library() {
  if (!_library) {
    const auto opened = _openLibrary();
    if (!opened) return opened.failure();
    _library = *opened;
  }
  return &*_library;
}

Result<std::unique_ptr<Bus>> ServiceAccess::open(const Connection& connection) {
  const auto isManaged = lookForManager();
  if (!isManaged) return isManaged.failure();
  if (!*isManaged)
    return Failure{"connect", connection.socket, "this machine has no service manager",
                   std::error_code(ENOENT, std::generic_category())};
  const auto opened = library();
  if (!opened) return opened.failure();
  return Bus::open(**opened, _root, connection.socket, connection.kind, &_runLoop);
}

Result<Bus*> ServiceAccess::use(Connection& connection) {
  if (connection.bus && connection.bus->isOpen()) return connection.bus.get();
  const auto began = RunLoop::Clock::now();
  if (connection.failure && began - connection.failedAt < Bus::timeWithoutRetry) return *connection.failure;
  connection.failure.reset();
  auto bus = open(connection);
  if (bus) {
    connection.bus = std::move(bus).value();
    return connection.bus.get();
  }
  connection.failedAt = RunLoop::Clock::now();
  if (connection.failedAt - began > slow) connection.failure = bus.failure();
  return bus.failure();
}

Result<Bus*> ServiceAccess::systemBus() {
  return use(_systemBus);
}

Result<Bus*> ServiceAccess::serviceManager() {
  auto bus = systemBus();
  if (bus) return bus;
  auto manager = use(_manager);
  return manager ? manager : bus;
}

Result<std::unique_ptr<Bus>> ServiceAccess::openSystemBus() const {
  if (!_library) return Failure{"connect", _systemBus.socket, "the bus was not used before"};
  return Bus::open(*_library, _root, _systemBus.socket, _systemBus.kind, nullptr);
}

Daemons& ServiceAccess::daemons() {
  if (hasServiceManager()) return _units;
  return _scripts;
}

}  // namespace tavisk
