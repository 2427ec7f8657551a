// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/RestartAfterPowerFailure.h"

#include <cerrno>

#include "effects/SettingNames.h"
#include "hosts/linux/power/PowerValues.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr std::uint8_t chassis = 0x00;
constexpr std::uint8_t getStatus = 0x01;
constexpr std::uint8_t setPolicy = 0x06;
constexpr const char* toSetPolicy = "Set Power Restore Policy";

/// IPMI 2.0, table 28-8; as bits 0 to 2 those that a controller knows.
enum Policy : std::uint8_t { stayOff = 0, asBefore = 1, turnOn = 2, askOnly = 3 };

constexpr bool knows(unsigned policies, Policy policy) {
  return ((policies >> policy) & 1U) != 0;
}

/// Whether the controller may still have such policies: whatever is done with it then tells why it did not say.
bool isUndecided(ControllerStatus status) {
  return status == EACCES || status == EBUSY || status == ETIMEDOUT;
}

}  // namespace

ControllerAnswer RestartAfterPowerFailure::policies() {
  auto answer = _controller.ask(toSetPolicy, {chassis, setPolicy, {askOnly}}, 1);
  if (answer.status != 0 || knows(answer.data[0], turnOn) || knows(answer.data[0], asBefore)) return answer;
  return {ENOSYS, {}, Failure{toSetPolicy, "the management controller", "it has no policy to restart"}};
}

Result<bool> RestartAfterPowerFailure::controllerRestarts() {
  constexpr unsigned policyShift = 5;
  constexpr unsigned unknown = 3;
  const auto answer = _controller.ask("Get Chassis Status", {chassis, getStatus, {}}, 1);
  if (answer.status != 0) return *answer.failure;
  const auto policy = (answer.data[0] >> policyShift) & 3U;
  if (policy == unknown)
    return Failure{"Get Chassis Status", "the management controller", "it does not know its policy"};
  return policy != stayOff;
}

Result<void> RestartAfterPowerFailure::setController(bool restarts) {
  const auto known = policies();
  if (known.status != 0) return *known.failure;
  const auto policy = !restarts ? stayOff : knows(known.data[0], turnOn) ? turnOn : asBefore;
  const auto answer = _controller.ask(toSetPolicy, {chassis, setPolicy, {policy}});
  if (answer.status != 0) return *answer.failure;
  return {};
}

Setting<std::string> RestartAfterPowerFailure::ofController() {
  Setting<std::string> setting;
  setting.where = "the management controller";
  setting.live = [this] { return asOnOff(controllerRestarts()); };
  setting.apply = [this](const std::string& value) { return setController(isOn(value)); };
  return setting;
}

Setting<std::string> RestartAfterPowerFailure::ofFirmware(const FirmwareAttribute& attribute) {
  Setting<std::string> setting;
  setting.where = attribute.folder + "current_value";
  setting.note = saying("the firmware takes it up at the next start");
  setting.stored = [this, attribute] { return asOnOff(attribute.isOn(_machine.root)); };
  setting.store = [this, attribute](const std::string& value) -> Result<void> {
    if (auto failure = whyNeedsRoot("write", attribute.folder)) return *failure;
    return attribute.set(_machine.root, isOn(value));
  };
  return setting;
}

Setting<std::string> RestartAfterPowerFailure::restartAfterPowerFailure() {
  const auto known = policies();
  const bool mayHave = known.status == 0 || isUndecided(known.status);
  const auto attribute = mayHave ? std::nullopt : restartAttribute(_machine.root);
  auto setting = attribute ? ofFirmware(*attribute) : ofController();
  setting.name = setting::restartAfterPowerFailure;
  if (!mayHave && !attribute) setting.supported = [reason = known.failure] { return reason; };
  return setting;
}

}  // namespace tavisk
