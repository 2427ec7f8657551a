// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchPowerController.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* registry = "Registry";
constexpr const char* services = "Services";
constexpr ControllerStatus refusedStatus = 1;
constexpr ControllerStatus noSuchDevice = 19;

/// Of a number or of one byte of data; any other value reads as 0.
std::int64_t numberIn(const PropertyList& value) {
  if (const auto* integer = value.asInteger()) return *integer;
  const auto* data = value.asData();
  return data && data->size() == 1 ? data->front() : 0;
}

/// A change writes `written`, of whatever type it is.
MachineSetting<std::int64_t> delayOf(const PowerController::Service& service, const std::string& property,
                                     const PropertyList& written = 0) {
  return {setting::startupDelay, "units of 30 seconds",
          [=](MachineFile& machine) {
            const auto ofService = machine.section(registry).section(services).section(service.name);
            const auto* value = ofService.find(property);
            return value ? std::optional(numberIn(*value)) : std::nullopt;
          },
          [=](MachineFile::Dictionary& machine, std::int64_t) {
            machine.dictionary(registry).dictionary(services).dictionary(service.name).set(property, written);
          }};
}

}  // namespace

ControllerStatus ScratchPowerController::masterPort() {
  return _settings.section(registry).integer("Master Port Status");
}

bool ScratchPowerController::isRegistryOpen() {
  return checked(masterPort(), "open", "the device registry") == 0;
}

std::optional<PowerController::Service> ScratchPowerController::serviceOfClass(const std::string& className) {
  const auto known = _settings.section(registry).section(services);
  return known.find(className) ? std::optional(Service{className}) : std::nullopt;
}

std::optional<std::int64_t> ScratchPowerController::numberProperty(const std::optional<Service>& service,
                                                                   const std::string& property) {
  if (service) return _settings.read(delayOf(*service, property));
  if (isRegistryOpen()) _settings.observeUnsupported(setting::startupDelay);
  return std::nullopt;
}

std::pair<ControllerStatus, PowerController::Connection> ScratchPowerController::open(
    const std::optional<Service>& service, std::uint32_t /*connectionType*/) {
  if (!service) {
    if (isRegistryOpen()) _settings.recordUnsupported(setting::startupDelay);
    return {noSuchDevice, {}};
  }
  return {checked(section(*service).integer("Open Status"), "open", service->name), {*service}};
}

ControllerStatus ScratchPowerController::setProperties(const Connection& connection,
                                                       const PropertyList::Dictionary& properties, std::int64_t asked) {
  const auto status = section(connection.service).integer("Set Status");
  if (status != 0) return checked(status, "set properties", connection.service.name);
  for (const auto& [property, value] : properties) {
    const auto setting = delayOf(connection.service, property, value);
    const auto effect = _settings.change(setting, asked);
    const bool isKept = !effect.where.empty() && effect.live == textOf(numberIn(value));
    if (effect.outcome == Outcome::failed && !isKept) return refusedStatus;
  }
  return 0;
}

ControllerStatus ScratchPowerController::close(const Connection& connection) {
  return checked(section(connection.service).integer("Close Status"), "close", connection.service.name);
}

MachineSection ScratchPowerController::section(const Service& service) {
  return _settings.section(registry).section(services).section(service.name);
}

ControllerStatus ScratchPowerController::checked(ControllerStatus status, const char* tried, const std::string& on) {
  if (status != 0) _effects.recordFailure(setting::startupDelay, {tried, on, "status " + std::to_string(status)});
  return status;
}

}  // namespace tavisk
