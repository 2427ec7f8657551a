// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/LinuxPowerController.h"

#include <cerrno>

#include "base/Result.h"
#include "base/Text.h"
#include "effects/SettingNames.h"
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

}  // namespace

ControllerStatus LinuxPowerController::recorded(ControllerStatus status, const Failure& failure) {
  _machine.effects.recordFailure(setting::startupDelay, failure);
  return status;
}

ControllerStatus LinuxPowerController::masterPort() {
  if (_machine.root.exists(deviceClass)) return 0;
  return recorded(ENODEV, systemFailure("look at the devices", deviceClass, ENODEV));
}

std::optional<PowerController::Service> LinuxPowerController::serviceOfClass(const std::string& className) {
  if (className != controllerClass) return std::nullopt;
  // The driver is loaded by this, where it is not yet; whether it opens is not asked here.
  static_cast<void>(_controller.open());
  for (const auto& controller : _machine.root.list(controllers).valueOr({}))
    if (readKernelFile(_machine.root, controllers + controller + "/device/type").valueOr("") == "kcs")
      return Service{className};
  return std::nullopt;
}

Result<std::optional<std::string>> LinuxPowerController::askDelay(const StartupDelayRequests& requests) {
  constexpr const char* tried = "get the start-up delay";
  const auto answer = _controller.ask(tried, {requests.function, *requests.get, {}}, requests.width);
  if (answer.status != 0) return *answer.failure;
  return std::optional(std::to_string(requests.delayIn(answer.data).value_or(0) / secondsEach));
}

ControllerAnswer LinuxPowerController::sendDelay(const StartupDelayRequests& requests, std::uint32_t units) {
  constexpr const char* tried = "set the start-up delay";
  const auto request = requests.setting(units * secondsEach);
  if (request) return _controller.ask(tried, *request);
  return {EINVAL, {}, Failure{tried, "the management controller", "it cannot have a delay of this length"}};
}

Setting<std::string> LinuxPowerController::delaySetting(const StartupDelayRequests& requests) {
  Setting<std::string> delay;
  delay.name = setting::startupDelay;
  delay.unit = "units of 30 seconds";
  delay.where = "the management controller";
  if (requests.get) {
    delay.live = [this, requests] { return askDelay(requests); };
    return delay;
  }
  delay.note = saying("this controller does not tell its delay: the wish is kept in " + std::string(wishFile));
  delay.stored = [this]() -> Result<std::optional<std::string>> {
    const auto wish = readKernelFile(_machine.root, wishFile);
    return wish ? std::optional(*wish) : std::nullopt;
  };
  // What the controller has may have changed since.
  delay.always = true;
  return delay;
}

std::optional<std::int64_t> LinuxPowerController::numberProperty(const Service& /*service*/,
                                                                 const std::string& property) {
  if (property != delayProperty) return std::nullopt;
  const auto identity = _controller.identity();
  const auto known = identity.failure ? Result<StartupDelayRequests>(*identity.failure)
                                      : startupDelayRequests(_machine.root, manufacturerIn(identity));
  if (!known) {
    recorded(ENOSYS, known.failure());
    return std::nullopt;
  }
  const auto units = observe(delaySetting(*known), _machine.effects);
  return units ? std::optional(leadingInteger(*units)) : std::nullopt;
}

std::pair<ControllerStatus, PowerController::Connection> LinuxPowerController::open(
    const std::optional<Service>& service, std::uint32_t /*connectionType*/) {
  const auto status = service ? _controller.open() : ENODEV;
  if (status != 0) recorded(status, systemFailure("open", "the management controller", static_cast<int>(status)));
  return {status, service ? Connection{*service} : Connection{}};
}

ControllerStatus LinuxPowerController::setProperties(const Connection& /*connection*/,
                                                     const PropertyList::Dictionary& properties) {
  const auto units = byteIn(properties);
  if (!units || properties.size() != 1)
    return recorded(EINVAL, {"set properties", "the management controller", "its one property is ServerID, one byte"});
  const auto identity = _controller.identity();
  return identity.failure ? recorded(identity.status, *identity.failure) : setDelay(identity, *units);
}

ControllerStatus LinuxPowerController::setDelay(const ControllerAnswer& identity, std::uint8_t units) {
  const auto known = startupDelayRequests(_machine.root, manufacturerIn(identity));
  ControllerStatus status = 0;
  Setting<std::string> delay = known ? delaySetting(*known) : Setting<std::string>();
  delay.name = setting::startupDelay;
  if (!known) delay.supported = [&] { return known.failure(); };
  delay.apply = [&](const std::string& asked) -> Result<void> {
    const auto answer = sendDelay(*known, units);
    status = answer.status;
    if (answer.failure) return *answer.failure;
    return known->get ? Result<void>() : _machine.root.write(wishFile, asked + "\n");
  };
  const auto outcome = carryOut(delay, std::to_string(units), _machine.effects, _machine.runLoop).outcome;
  if (outcome == Outcome::notSupported) return ENOSYS;
  return outcome == Outcome::failed && status == 0 ? EIO : status;
}

ControllerStatus LinuxPowerController::close(const Connection& /*connection*/) {
  return 0;
}

}  // namespace tavisk
