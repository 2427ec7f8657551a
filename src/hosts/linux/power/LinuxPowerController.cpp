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
constexpr const char* toSetDelay = "set the start-up delay";
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

/// Whether the machine has no controller with a start-up delay; what cannot be read or understood says nothing of it.
bool cannotHave(const Failure& failure) {
  return failure.code == std::errc::function_not_supported || failure.code == std::errc::no_such_device;
}

Support supportAfter(const Failure& failure) {
  if (cannotHave(failure)) return NotSupported{failure};
  return failure;
}

/// A board may lack a command of its maker. Of another failure it is not said whether it does.
Support supportBy(const Result<std::int64_t>& delay) {
  if (!delay && cannotHave(delay.failure())) return NotSupported{delay.failure()};
  return std::nullopt;
}

Failure invalid(const char* tried, const char* why) {
  return {tried, managementController, why, std::make_error_code(std::errc::invalid_argument)};
}

}  // namespace

ControllerStatus LinuxPowerController::recorded(const Failure& failure) {
  if (cannotHave(failure))
    _machine.effects.recordUnsupported(setting::startupDelay, failure);
  else
    _machine.effects.recordFailure(setting::startupDelay, failure);
  return statusOf(failure, EIO);
}

ControllerStatus LinuxPowerController::masterPort() {
  const auto there = _machine.root.isThere(deviceClass);
  if (!there) return statusOf(there.failure(), EIO);
  return *there ? 0 : ENODEV;
}

Result<void> LinuxPowerController::look() {
  // The driver is loaded by this, where it is not yet; whether it opens is not asked here.
  static_cast<void>(_controller.open());
  const auto typeOf = [this](const std::string& controller) {
    return orGone(readKernelFile(_machine.root, controllers + controller + "/device/type"));
  };
  const auto types = ofEachIn(_machine.root, controllers, typeOf);
  if (!types) return types.failure();
  if (std::ranges::find(*types, "kcs") != types->end()) return {};
  return Failure{"find", managementController, "this machine has none, or no driver for it (ipmi_si, ipmi_devintf)",
                 std::make_error_code(std::errc::no_such_device)};
}

std::optional<PowerController::Service> LinuxPowerController::serviceOfClass(const std::string& className) {
  if (className != controllerClass) return std::nullopt;
  return look() ? std::optional(Service{className}) : std::nullopt;
}

Result<StartupDelayRequests> LinuxPowerController::requests() {
  if (const auto there = look(); !there) return there.failure();
  const auto manufacturer = _controller.manufacturer();
  return manufacturer ? startupDelayRequests(_machine.root, *manufacturer) : manufacturer.failure();
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

Result<ControllerRequest> LinuxPowerController::requestFor(const StartupDelayRequests& requests, std::uint32_t units) {
  const auto request = requests.setting(units * secondsEach);
  if (!request) return invalid(toSetDelay, "it cannot have a delay of this length");
  return *request;
}

Result<void> LinuxPowerController::sendDelay(const StartupDelayRequests& requests, std::uint32_t units) {
  const auto request = requestFor(requests, units);
  const auto answer = request ? _controller.ask(toSetDelay, *request) : request.failure();
  return answer ? Result<void>() : answer.failure();
}

Setting<std::int64_t> LinuxPowerController::delaySetting(const Result<StartupDelayRequests>& requests) {
  Setting<std::int64_t> delay;
  delay.name = setting::startupDelay;
  delay.unit = "units of 30 seconds";
  delay.where = managementController;
  if (!requests) {
    delay.supported = [why = requests.failure()] { return supportAfter(why); };
    delay.live = [why = requests.failure()] { return why; };
  } else if (requests->get) {
    delay.supported = [this, known = *requests] { return supportBy(askDelay(known)); };
    delay.live = [this, known = *requests] { return askDelay(known); };
  } else {
    delay.note = saying("this controller does not tell its delay: the wish is kept in " + std::string(wishFile));
    delay.stored = [this] { return keptWish(); };
    // What the controller has may have changed since.
    delay.always = true;
  }
  return delay;
}

std::optional<std::int64_t> LinuxPowerController::numberProperty(const std::optional<Service>& /*service*/,
                                                                 const std::string& property) {
  if (property != delayProperty) return std::nullopt;
  return observe(delaySetting(requests()), _machine.effects);
}

std::pair<ControllerStatus, PowerController::Connection> LinuxPowerController::open(
    const std::optional<Service>& service, std::uint32_t /*connectionType*/) {
  const auto there = look();
  const auto opened = there ? _controller.open() : there;
  if (service) return {opened ? 0 : recorded(opened.failure()), Connection{*service}};
  recorded(there ? systemFailure("open", managementController, ENODEV) : there.failure());
  return {ENODEV, {}};
}

ControllerStatus LinuxPowerController::setProperties(const Connection& /*connection*/,
                                                     const PropertyList::Dictionary& properties, std::int64_t asked) {
  const auto units = byteIn(properties);
  if (units && properties.size() == 1) return setDelay(*units, asked);
  return recorded(invalid("set properties", "its one property is ServerID, one byte"));
}

ControllerStatus LinuxPowerController::setDelay(std::uint8_t units, std::int64_t asked) {
  const auto known = requests();
  Result<void> sent;
  Result<void> kept;
  auto delay = delaySetting(known);
  delay.check = [&](std::int64_t) {
    if (const auto request = requestFor(*known, units); !request) sent = request.failure();
    return sent;
  };
  delay.apply = [&](std::int64_t) {
    sent = sendDelay(*known, units);
    if (sent && !known->get) kept = _machine.root.write(wishFile, textOf(std::int64_t{units}) + "\n");
    return sent ? kept : sent;
  };
  if (known && !known->get)
    delay.written = [&] { return !sent ? "" : managementController + (kept ? std::string(", ") + wishFile : ""); };
  const auto effect = carryOut(delay, asked, _machine);
  if (effect.outcome == Outcome::applied || effect.outcome == Outcome::unchanged) return 0;
  if (!known) return statusOf(known.failure(), ENOSYS);
  if (effect.outcome == Outcome::notSupported) return statusOf(*effect.failure, ENOSYS);
  if (!sent) return statusOf(sent.failure(), EIO);
  const bool isKept = (delay.live ? effect.live : effect.stored) == textOf(std::int64_t{units});
  return isKept ? 0 : EIO;
}

ControllerStatus LinuxPowerController::close(const Connection& /*connection*/) {
  return 0;
}

}  // namespace tavisk
