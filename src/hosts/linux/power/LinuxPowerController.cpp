// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/LinuxPowerController.h"

#include <algorithm>
#include <cerrno>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* deviceClass = "/sys/class";
constexpr const char* controllers = "/sys/class/ipmi/";
constexpr const char* controllerClass = "VelmarKCS";
constexpr const char* delayProperty = "ServerID";
constexpr std::uint32_t secondsEach = 30;
/// Kept for controllers that do not tell their delay.
constexpr const char* wishFile = "/var/lib/tavisk/startup-delay";

std::optional<std::uint8_t> byteIn(const PropertyList::Dictionary& properties) {
  const auto* value = properties.find(delayProperty);
  const auto* data = value ? value->asData() : nullptr;
  return data && data->size() == 1 ? std::optional(data->front()) : std::nullopt;
}

ControllerStatus statusOf(const Failure& failure, int withoutCode) {
  return failure.code ? failure.code.value() : withoutCode;
}

/// A controller of another maker cannot have the setting; a file that cannot be read or understood says nothing of it.
Support whyNotKnown(const Failure& failure) {
  if (failure.code == std::errc::function_not_supported) return NotSupported{failure};
  return failure;
}

Failure invalid(const char* tried, const char* why) {
  return {tried, managementController, why, std::make_error_code(std::errc::invalid_argument)};
}

}  // namespace

ControllerStatus LinuxPowerController::recorded(const Failure& failure) {
  _machine.effects.recordFailure(setting::startupDelay, failure);
  return statusOf(failure, EIO);
}

ControllerStatus LinuxPowerController::masterPort() {
  const auto there = _machine.root.isThere(deviceClass);
  if (!there) return recorded(there.failure());
  return *there ? 0 : recorded(systemFailure("look at the devices", deviceClass, ENODEV));
}

std::optional<PowerController::Service> LinuxPowerController::serviceOfClass(const std::string& className) {
  if (className != controllerClass) return std::nullopt;
  // The driver is loaded by this, where it is not yet; whether it opens is not asked here.
  static_cast<void>(_controller.open());
  const auto typeOf = [this](const std::string& controller) {
    return orGone(readKernelFile(_machine.root, controllers + controller + "/device/type"));
  };
  const auto types = ofEachIn(_machine.root, controllers, typeOf);
  if (!types) recorded(types.failure());
  const bool hasOne = types && std::ranges::find(*types, "kcs") != types->end();
  return hasOne ? std::optional(Service{className}) : std::nullopt;
}

Result<std::int64_t> LinuxPowerController::askDelay(const StartupDelayRequests& requests) {
  constexpr const char* tried = "get the start-up delay";
  const auto answer = _controller.ask(tried, {requests.function, *requests.get, {}}, requests.width);
  if (!answer) return answer.failure();
  return static_cast<std::int64_t>(requests.delayIn(*answer).value_or(0) / secondsEach);
}

Result<std::optional<std::int64_t>> LinuxPowerController::keptWish() const {
  const auto wish = orEmpty(readKernelFile(_machine.root, wishFile));
  if (!wish) return wish.failure();
  return parseNumber<std::int64_t>(*wish);
}

Result<void> LinuxPowerController::sendDelay(const StartupDelayRequests& requests, std::uint32_t units) {
  constexpr const char* tried = "set the start-up delay";
  const auto request = requests.setting(units * secondsEach);
  if (!request) return invalid(tried, "it cannot have a delay of this length");
  const auto answer = _controller.ask(tried, *request);
  return answer ? Result<void>() : answer.failure();
}

Setting<std::int64_t> LinuxPowerController::delaySetting(const StartupDelayRequests& requests) {
  Setting<std::int64_t> delay;
  delay.name = setting::startupDelay;
  delay.unit = "units of 30 seconds";
  delay.where = managementController;
  if (requests.get) {
    delay.live = [this, requests] { return askDelay(requests); };
    return delay;
  }
  delay.note = saying("this controller does not tell its delay: the wish is kept in " + std::string(wishFile));
  delay.stored = [this] { return keptWish(); };
  // What the controller has may have changed since.
  delay.always = true;
  return delay;
}

std::optional<std::int64_t> LinuxPowerController::numberProperty(const Service& /*service*/,
                                                                 const std::string& property) {
  if (property != delayProperty) return std::nullopt;
  const auto manufacturer = _controller.manufacturer();
  const auto known = manufacturer ? startupDelayRequests(_machine.root, *manufacturer)
                                  : Result<StartupDelayRequests>(manufacturer.failure());
  if (known) return observe(delaySetting(*known), _machine.effects);
  recorded(known.failure());
  return std::nullopt;
}

std::pair<ControllerStatus, PowerController::Connection> LinuxPowerController::open(
    const std::optional<Service>& service, std::uint32_t /*connectionType*/) {
  const auto opened = service ? _controller.open() : systemFailure("open", managementController, ENODEV);
  return {opened ? 0 : recorded(opened.failure()), service ? Connection{*service} : Connection{}};
}

ControllerStatus LinuxPowerController::setProperties(const Connection& /*connection*/,
                                                     const PropertyList::Dictionary& properties) {
  const auto units = byteIn(properties);
  if (!units || properties.size() != 1)
    return recorded(invalid("set properties", "its one property is ServerID, one byte"));
  const auto manufacturer = _controller.manufacturer();
  return manufacturer ? setDelay(*manufacturer, *units) : recorded(manufacturer.failure());
}

ControllerStatus LinuxPowerController::setDelay(std::uint32_t manufacturer, std::uint8_t units) {
  const auto known = startupDelayRequests(_machine.root, manufacturer);
  ControllerStatus status = 0;
  auto delay = known ? delaySetting(*known) : Setting<std::int64_t>();
  delay.name = setting::startupDelay;
  if (!known) delay.supported = [&] { return whyNotKnown(known.failure()); };
  delay.apply = [&](std::int64_t asked) -> Result<void> {
    auto sent = sendDelay(*known, units);
    if (!sent) status = statusOf(sent.failure(), EIO);
    if (!sent || known->get) return sent;
    return _machine.root.write(wishFile, textOf(asked) + "\n");
  };
  const auto outcome = carryOut(delay, units, _machine).outcome;
  if (!known) return statusOf(known.failure(), ENOSYS);
  return outcome == Outcome::failed && status == 0 ? EIO : status;
}

ControllerStatus LinuxPowerController::close(const Connection& /*connection*/) {
  return 0;
}

}  // namespace tavisk
