// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/ServiceAccess.h"

#include "platform/linux/InitScriptDaemons.h"
#include "platform/linux/UnitDaemons.h"

namespace tavisk {
namespace {

constexpr const char* managerMark = "/run/systemd/system/";
constexpr const char* busSocket = "/run/dbus/system_bus_socket";
constexpr const char* managerSocket = "/run/systemd/private";

}  // namespace

bool ServiceAccess::hasServiceManager() const {
  return _root.exists(managerMark);
}

Result<const SystemdLibrary*> ServiceAccess::library() {
  if (!_library) {
    auto opened = openSystemdLibrary();
    if (!opened) return opened.failure();
    _library = *opened;
  }
  return &*_library;
}

Result<Bus*> ServiceAccess::keep(std::unique_ptr<Bus>& place, const char* socket, Bus::Kind kind) {
  if (place && place->isOpen()) return place.get();
  if (!hasServiceManager()) return Failure{"connect", socket, "this machine has no service manager"};
  auto opened = library();
  if (!opened) return opened.failure();
  auto bus = Bus::open(**opened, _root, socket, kind);
  if (!bus) return bus.failure();
  place = std::move(bus).value();
  return place.get();
}

Result<Bus*> ServiceAccess::systemBus() {
  return keep(_systemBus, busSocket, Bus::Kind::messageBus);
}

Result<Bus*> ServiceAccess::serviceManager() {
  auto bus = systemBus();
  if (bus) return bus;
  auto manager = keep(_manager, managerSocket, Bus::Kind::straightToService);
  return manager ? manager : bus;
}

Result<std::unique_ptr<Bus>> ServiceAccess::openSystemBus() const {
  if (!_library) return Failure{"connect", busSocket, "the bus was not used before"};
  return Bus::open(*_library, _root, busSocket, Bus::Kind::messageBus);
}

Daemons& ServiceAccess::daemons() {
  if (!_daemons && hasServiceManager()) _daemons = std::make_unique<UnitDaemons>(*this, _runLoop);
  if (!_daemons) _daemons = std::make_unique<InitScriptDaemons>(_root, _runLoop);
  return *_daemons;
}

}  // namespace tavisk
