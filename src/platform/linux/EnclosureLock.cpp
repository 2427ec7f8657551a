// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/EnclosureLock.h"

#include <cstdint>

#include "platform/SettingChange.h"
#include "platform/SettingNames.h"
#include "platform/linux/Keyboards.h"
#include "platform/linux/OnOff.h"

namespace tavisk {
namespace {

constexpr std::uint8_t chassis = 0x00;
constexpr std::uint8_t getCapabilities = 0x00;
constexpr std::uint8_t getStatus = 0x01;
constexpr unsigned frontPanelLockout = 0x02;  // in the capabilities and in the third byte of the status

const char* textOf(bool disabled) {
  return disabled ? "keyboards disabled" : "keyboards enabled";
}

Result<std::optional<std::string>> stateOf(const SystemRoot& root, const std::vector<std::string>& keyboards) {
  std::size_t inhibited = 0;
  for (const auto& keyboard : keyboards) {
    const auto is = isInhibited(root, keyboard);
    if (!is) return is.failure();
    if (*is) ++inhibited;
  }
  if (inhibited != 0 && inhibited != keyboards.size()) return std::optional<std::string>("some keyboards disabled");
  return std::optional<std::string>(textOf(inhibited != 0));
}

Result<void> inhibitAll(const SystemRoot& root, const std::vector<std::string>& keyboards, bool inhibit) {
  for (const auto& keyboard : keyboards)
    if (auto set = setInhibited(root, keyboard, inhibit); !set) return set;
  return {};
}

std::optional<Failure> whyNotSupported(const Result<bool>& engaged, const std::vector<std::string>& keyboards) {
  if (!engaged) return engaged.failure();
  if (keyboards.empty()) return Failure{"find a keyboard", "/sys/class/input", "there is none at this machine"};
  return std::nullopt;
}

}  // namespace

Result<bool> EnclosureLock::isEngaged() {
  const auto capabilities = _controller.ask("Get Chassis Capabilities", {chassis, getCapabilities, {}}, 1);
  if (capabilities.status != 0) return *capabilities.failure;
  if ((capabilities.data[0] & frontPanelLockout) == 0)
    return Failure{"Get Chassis Capabilities", "the management controller", "it tells of no lock of the front panel"};
  const auto status = _controller.ask("Get Chassis Status", {chassis, getStatus, {}}, 3);
  if (status.status != 0) return *status.failure;
  return (status.data[2] & frontPanelLockout) != 0;
}

void EnclosureLock::setDisablesKeyboard(bool disables) {
  if (const auto failure = whyNeedsRoot("disable keyboards", "/sys/class/input"))
    return _machine.effects.recordFailure(setting::keyboardLock, *failure, onOff(disables));
  const auto engaged = isEngaged();
  const auto found = keyboards(_machine.root);
  const bool inhibit = disables && engaged.valueOr(false);
  Setting setting;
  setting.name = setting::keyboardLock;
  setting.note = !engaged ? "the preference is kept" : *engaged ? "the lock is engaged" : "the lock is open";
  setting.supported = [&] { return whyNotSupported(engaged, found); };
  setting.live = [&] { return stateOf(_machine.root, found); };
  setting.apply = [&](const std::string&) { return inhibitAll(_machine.root, found, inhibit); };
  carryOut(setting, textOf(inhibit), _machine.effects, _machine.runLoop);
}

}  // namespace tavisk
