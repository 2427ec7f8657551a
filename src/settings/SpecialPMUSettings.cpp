// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "settings/SpecialPMUSettings.h"

#include <new>
#include <string>

namespace tavisk {
namespace {

constexpr const char* controllerClasses[] = {"VelmarPMU", "VelmarSMU", "VelmarKCS"};
constexpr const char* serverID = "ServerID";
constexpr std::uint32_t connectionType = 0x0101FACE;

/// Absent when there is no memory for it.
std::optional<PropertyList::Dictionary> dictionaryOf(std::uint8_t value) {
  try {
    PropertyList::Dictionary properties;
    properties.set(serverID, PropertyList::Data{value});
    return properties;
  } catch (const std::bad_alloc&) {
    return std::nullopt;
  }
}

}  // namespace

std::optional<PowerController::Service> SpecialPMUSettings::getServerIDInterface() {
  if (const auto status = _controller.masterPort(); status != 0) {
    _output.print("waitForStartupAfterPowerFailure: Error, IOMasterPort() returned: %#lx; unable to process request\n",
                  status);
    return std::nullopt;
  }
  for (const char* name : controllerClasses) {
    if (auto service = _controller.serviceOfClass(name)) return service;
  }
  return std::nullopt;
}

std::int64_t SpecialPMUSettings::getServerIDValue() {
  const auto service = getServerIDInterface();
  return service ? _controller.numberProperty(*service, serverID).value_or(0) : 0;
}

bool SpecialPMUSettings::setServerIDValue(std::uint8_t value) {
  const auto service = getServerIDInterface();
  _systemLog.write("Set time to " + std::to_string(value));
  const auto [status, connection] = _controller.open(service, connectionType);
  if (status != 0) {
    _output.print("setWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned %#lx\n", status);
    return false;
  }
  if (!writeServerID(connection, value)) return false;
  close(connection);
  return true;
}

bool SpecialPMUSettings::writeServerID(const Connection& connection, std::uint8_t value) {
  const auto properties = dictionaryOf(value);
  if (!properties) {
    _output.putLine("setWaitForStartupAfterPowerFailure: Error,Internal CF Dictionary could not be created. ");
    return false;
  }
  if (const auto status = _controller.setProperties(connection, *properties); status != 0) {
    _output.print("setWaitForStartupAfterPowerFailure: Error, IOConnectSetCFProperties returned %#lx\n", status);
    return false;
  }
  return true;
}

void SpecialPMUSettings::close(const Connection& connection) {
  if (const auto status = _controller.close(connection); status != 0) {
    _output.print("setWaitForStartupAfterPowerFailure: Error, IOServiceClose returned %#lx\n\n", status);
  }
}

}  // namespace tavisk
