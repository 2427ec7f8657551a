// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/RestartAfterPowerFailure.h"

#include "effects/SettingNames.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr std::uint8_t chassis = 0x00;
constexpr std::uint8_t getStatus = 0x01;
constexpr std::uint8_t setPolicy = 0x06;
constexpr const char* toGetStatus = "Get Chassis Status";
constexpr const char* toSetPolicy = "Set Power Restore Policy";

/// IPMI 2.0, table 28-8; as bits 0 to 2 those that a controller knows.
enum Policy : std::uint8_t { stayOff = 0, asBefore = 1, turnOn = 2, askOnly = 3 };

constexpr bool knows(unsigned policies, Policy policy) {
  return ((policies >> policy) & 1U) != 0;
}

/// Whether the controller may still have such policies: whatever is done with it then tells why it did not say.
bool isUndecided(const std::error_code& error) {
  return error == std::errc::permission_denied || error == std::errc::device_or_resource_busy ||
         error == std::errc::timed_out;
}

}  // namespace

Result<std::uint8_t> RestartAfterPowerFailure::policies() {
  const auto answer = _controller.ask(toSetPolicy, {chassis, setPolicy, {askOnly}}, 1);
  if (!answer) return answer.failure();
  const auto known = answer->front();
  if (knows(known, turnOn) || knows(known, asBefore)) return known;
  return Failure{toSetPolicy, managementController, "it has no policy to restart"};
}

Result<bool> RestartAfterPowerFailure::controllerRestarts() {
  constexpr unsigned policyShift = 5;
  constexpr unsigned unknown = 3;
  const auto answer = _controller.ask(toGetStatus, {chassis, getStatus, {}}, 1);
  if (!answer) return answer.failure();
  const auto policy = (answer->front() >> policyShift) & 3U;
  if (policy == unknown) return Failure{toGetStatus, managementController, "it does not know its policy"};
  return policy != stayOff;
}

Result<void> RestartAfterPowerFailure::setController(bool restarts) {
  const auto known = policies();
  if (!known) return known.failure();
  const auto policy = !restarts ? stayOff : knows(*known, turnOn) ? turnOn : asBefore;
  const auto answer = _controller.ask(toSetPolicy, {chassis, setPolicy, {policy}});
  return answer ? Result<void>() : answer.failure();
}

Setting<bool> RestartAfterPowerFailure::ofController() {
  Setting<bool> setting;
  setting.where = managementController;
  setting.live = [this] { return controllerRestarts(); };
  setting.apply = [this](bool restarts) { return setController(restarts); };
  return setting;
}

Setting<bool> RestartAfterPowerFailure::ofFirmware(const FirmwareAttribute& attribute) {
  Setting<bool> setting;
  setting.where = attribute.folder + "current_value";
  setting.note = saying("the firmware takes it up at the next start");
  setting.stored = [this, attribute] { return attribute.isOn(_machine.root); };
  setting.store = [this, attribute](bool restarts) -> Result<void> {
    if (auto failure = whyNeedsRoot("write", attribute.folder)) return *failure;
    return attribute.set(_machine.root, restarts);
  };
  return setting;
}

Setting<bool> RestartAfterPowerFailure::restartAfterPowerFailure() {
  const auto known = policies();
  const bool mayHave = known || isUndecided(known.failure().code);
  const auto attribute = mayHave ? std::nullopt : restartAttribute(_machine.root);
  auto setting = attribute ? ofFirmware(*attribute) : ofController();
  setting.name = setting::restartAfterPowerFailure;
  if (!mayHave && !attribute) setting.supported = [reason = known.failure()] { return asSupport(reason); };
  return setting;
}

}  // namespace tavisk
