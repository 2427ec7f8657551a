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

std::uint8_t lowByteOf(std::int64_t number) {
  return static_cast<std::uint8_t>(number);
}

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

bool SpecialPMUSettings::hasMasterPort() {
  const auto status = _controller.masterPort();
  if (status == 0) return true;
  _output.print("waitForStartupAfterPowerFailure: Error, IOMasterPort() returned: %#lx; unable to process request\n",
                status);
  return false;
}

std::optional<PowerController::Service> SpecialPMUSettings::getServerIDInterface() {
  for (const char* name : controllerClasses) {
    if (auto service = _controller.serviceOfClass(name)) return service;
  }
  return std::nullopt;
}

std::int64_t SpecialPMUSettings::getServerIDValue() {
  const auto service = hasMasterPort() ? getServerIDInterface() : std::nullopt;
  return _controller.numberProperty(service, serverID).value_or(0);
}

bool SpecialPMUSettings::setServerIDValue(std::int64_t asked) {
  const auto service = hasMasterPort() ? getServerIDInterface() : std::nullopt;
  _systemLog.write("Set time to " + std::to_string(lowByteOf(asked)));
  const auto [status, connection] = _controller.open(service, connectionType);
  if (status != 0) {
    _output.print("setWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned %#lx\n", status);
    return false;
  }
  if (!writeServerID(connection, asked)) return false;
  close(connection);
  return true;
}

bool SpecialPMUSettings::writeServerID(const Connection& connection, std::int64_t asked) {
  const auto properties = dictionaryOf(lowByteOf(asked));
  if (!properties) {
    _output.putLine("setWaitForStartupAfterPowerFailure: Error,Internal CF Dictionary could not be created. ");
    return false;
  }
  if (const auto status = _controller.setProperties(connection, *properties, asked); status != 0) {
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
