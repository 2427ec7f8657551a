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

/// Whether there is no controller with such policies, as against one that did not say.
bool hasNone(const std::error_code& error) {
  return !error || error == std::errc::no_such_device || error == std::errc::no_such_device_or_address ||
         error == std::errc::function_not_supported || error == std::errc::invalid_argument;
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
  setting.check = [attribute](bool) -> Result<void> {
    if (auto failure = whyNeedsRoot("write", attribute.folder)) return *failure;
    return {};
  };
  setting.store = [this, attribute](bool restarts) { return attribute.set(_machine.root, restarts); };
  return setting;
}

Setting<bool> RestartAfterPowerFailure::restartAfterPowerFailure() {
  const auto known = policies();
  const bool isLackedByController = !known && hasNone(known.failure().code);
  const auto attribute = isLackedByController ? restartAttribute(_machine.root) : std::nullopt;
  auto setting = attribute && *attribute ? ofFirmware(**attribute) : ofController();
  setting.name = setting::restartAfterPowerFailure;
  if (known || (attribute && *attribute)) return setting;
  if (!isLackedByController || !attribute)
    setting.supported = [failed = attribute ? known.failure() : attribute.failure()]() -> Support { return failed; };
  else
    setting.supported = [reason = known.failure()]() -> Support { return NotSupported{reason}; };
  return setting;
}

}  // namespace tavisk
