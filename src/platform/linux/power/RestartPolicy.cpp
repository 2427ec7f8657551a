// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/power/RestartPolicy.h"

#include <cerrno>

#include "platform/SettingNames.h"
#include "platform/linux/power/PowerValues.h"

namespace tavisk {
namespace {

constexpr std::uint8_t chassis = 0x00;
constexpr std::uint8_t getStatus = 0x01;
constexpr std::uint8_t setPolicy = 0x06;

/// IPMI 2.0, table 28-8; as bits 0 to 2 those that a controller knows.
enum Policy : std::uint8_t { stayOff = 0, asBefore = 1, turnOn = 2, askOnly = 3 };

constexpr bool knows(unsigned policies, Policy policy) {
  return ((policies >> policy) & 1U) != 0;
}

}  // namespace

Result<unsigned> RestartPolicy::policies() {
  const auto answer = _controller.ask("Set Power Restore Policy", {chassis, setPolicy, {askOnly}}, 1);
  if (answer.status != 0) return *answer.failure;
  const unsigned known = answer.data[0];
  if (knows(known, turnOn) || knows(known, asBefore)) return known;
  return Failure{"Set Power Restore Policy", "the management controller", "it has no policy to restart"};
}

Result<bool> RestartPolicy::controllerRestarts() {
  constexpr unsigned policyShift = 5;
  constexpr unsigned unknown = 3;
  const auto answer = _controller.ask("Get Chassis Status", {chassis, getStatus, {}}, 1);
  if (answer.status != 0) return *answer.failure;
  const auto policy = (answer.data[0] >> policyShift) & 3U;
  if (policy == unknown)
    return Failure{"Get Chassis Status", "the management controller", "it does not know its policy"};
  return policy != stayOff;
}

Result<void> RestartPolicy::setController(bool restarts) {
  const auto known = policies();
  if (!known) return known.failure();
  const auto policy = !restarts ? stayOff : knows(*known, turnOn) ? turnOn : asBefore;
  const auto answer = _controller.ask("Set Power Restore Policy", {chassis, setPolicy, {policy}});
  if (answer.status != 0) return *answer.failure;
  return {};
}

Setting RestartPolicy::ofController() {
  Setting setting;
  setting.where = "the management controller";
  setting.live = [this] { return asOnOff(controllerRestarts()); };
  setting.apply = [this](const std::string& value) { return setController(isOn(value)); };
  return setting;
}

Setting RestartPolicy::ofFirmware(const FirmwareAttribute& attribute) {
  Setting setting;
  setting.where = attribute.folder + "current_value";
  setting.note = "the firmware takes it up at the next start";
  setting.stored = [this, attribute] { return asOnOff(attribute.isOn(_machine.root)); };
  setting.store = [this, attribute](const std::string& value) -> Result<void> {
    if (auto failure = whyNeedsRoot("write", attribute.folder)) return *failure;
    return attribute.set(_machine.root, isOn(value));
  };
  return setting;
}

Setting RestartPolicy::restartAfterPowerFailure() {
  const auto known = policies();
  const auto attribute = known ? std::nullopt : restartAttribute(_machine.root);
  auto setting = attribute ? ofFirmware(*attribute) : ofController();
  setting.name = setting::restartAfterPowerFailure;
  // A controller that may not be asked is no reason: whatever is done with it then tells why.
  const bool isHere = known || attribute || _controller.open() == EACCES;
  if (!isHere) setting.supported = [reason = known.failure()] { return reason; };
  return setting;
}

}  // namespace tavisk
