// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/KeyboardLock.h"

#include <algorithm>
#include <cstdint>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

constexpr const char* inputClass = "/sys/class/input";
constexpr const char* devices = "/sys/class/input/";
/// Vendor and product of the USB keyboards that management controllers have, where their names do not say so.
constexpr std::string_view controllersOwn[] = {"046b:ff10", "0557:2221", "0557:2419", "0624:0249", "03f0:7029"};

constexpr std::uint8_t chassis = 0x00;
constexpr std::uint8_t getCapabilities = 0x00;
constexpr std::uint8_t getStatus = 0x01;
constexpr unsigned frontPanelLockout = 0x02;  // in the capabilities and in the third byte of the status

enum class KeyboardState { enabled, disabled };

std::string textOf(KeyboardState state) {
  return state == KeyboardState::disabled ? "keyboards disabled" : "keyboards enabled";
}

/// Empty when the device has none, or has gone.
Result<std::string> valueOf(const SystemRoot& root, const std::string& file) {
  const auto value = orGone(readKernelFile(root, file));
  if (!value) return value.failure();
  return value->value_or("");
}

/// Whether it has the keys Escape to D, bits 1 to 31: by these udev knows keyboards from buttons too.
Result<bool> hasLetters(const SystemRoot& root, const std::string& device) {
  constexpr std::uint64_t letters = 0xFFFF'FFFE;
  const auto capabilities = valueOf(root, device + "/capabilities/key");
  if (!capabilities) return capabilities.failure();
  const auto words = split(*capabilities, " ");
  if (words.empty()) return false;
  const auto keys = parseNumber<std::uint64_t>(words.back(), 16).value_or(0);
  return (keys & letters) == letters;
}

Result<bool> isOfController(const SystemRoot& root, const std::string& device) {
  const auto name = valueOf(root, device + "/name");
  if (!name) return name.failure();
  if (lowerCased(*name).find("virtual") != std::string::npos) return true;
  const auto vendor = valueOf(root, device + "/id/vendor");
  if (!vendor) return vendor.failure();
  const auto product = valueOf(root, device + "/id/product");
  if (!product) return product.failure();
  return std::ranges::find(controllersOwn, *vendor + ":" + *product) != std::end(controllersOwn);
}

Result<bool> isKeyboard(const SystemRoot& root, const std::string& device) {
  auto letters = hasLetters(root, device);
  if (!letters || !*letters) return letters;
  const auto isPretended = isOfController(root, device);
  if (!isPretended) return isPretended.failure();
  return !*isPretended;
}

Setting<KeyboardState>::Found stateOf(const SystemRoot& root, const std::vector<std::string>& keyboards) {
  std::size_t inhibited = 0;
  for (const auto& keyboard : keyboards) {
    const auto is = isInhibited(root, keyboard);
    if (!is) return is.failure();
    if (*is) ++inhibited;
  }
  if (inhibited == 0) return KeyboardState::enabled;
  if (inhibited == keyboards.size()) return KeyboardState::disabled;
  return Reading(KeyboardState::disabled, "some keyboards disabled");
}

Result<void> setAll(const SystemRoot& root, const std::vector<std::string>& keyboards, KeyboardState state) {
  for (const auto& keyboard : keyboards)
    if (auto set = setInhibited(root, keyboard, state == KeyboardState::disabled); !set) return set;
  return {};
}

std::string remarkOn(const Result<bool>& engaged) {
  if (!engaged) return "";
  return *engaged ? "the lock is engaged" : "the lock is open";
}

/// Whether a machine has no lock: no controller, or one that tells of none.
bool isLockMissing(const Failure& failure) {
  return failure.code == std::errc::no_such_device || failure.code == std::errc::function_not_supported;
}

std::optional<Failure> whyNotSwitched() {
  return whyNeedsRoot("disable keyboards", inputClass);
}

/// A lock that is out of reach may be so for whoever is not root alone.
Support supportOf(const Result<bool>& engaged, const Result<std::vector<std::string>>& keyboards) {
  if (!engaged && !isLockMissing(engaged.failure())) return whyNotSwitched().value_or(engaged.failure());
  if (!engaged) return NotSupported{engaged.failure()};
  if (!keyboards) return keyboards.failure();
  if (keyboards->empty()) return NotSupported{{"find a keyboard", inputClass, "there is none at this machine"}};
  return std::nullopt;
}

/// What is given must outlive the setting.
Setting<KeyboardState> keyboardsUnder(const Result<bool>& engaged, const Result<std::vector<std::string>>& found,
                                      const SystemRoot& root) {
  Setting<KeyboardState> setting;
  setting.name = setting::keyboardLock;
  setting.supported = [&] { return supportOf(engaged, found); };
  setting.live = [&] { return found ? stateOf(root, *found) : found.failure(); };
  return setting;
}

}  // namespace

Result<std::vector<std::string>> keyboards(const SystemRoot& root) {
  const auto names = orEmpty(root.list(devices));
  if (!names) return names.failure();
  std::vector<std::string> found;
  for (const auto& name : *names) {
    if (!name.starts_with("input")) continue;
    const auto isFound = isKeyboard(root, devices + name);
    if (!isFound) return isFound.failure();
    if (*isFound) found.push_back(devices + name);
  }
  return found;
}

Result<bool> isInhibited(const SystemRoot& root, const std::string& keyboard) {
  const auto value = readKernelFile(root, keyboard + "/inhibited");
  if (!value) return value.failure();
  return *value != "0";
}

Result<void> setInhibited(const SystemRoot& root, const std::string& keyboard, bool inhibited) {
  return writeKernelFile(root, keyboard + "/inhibited", inhibited ? "1" : "0");
}

Result<bool> EnclosureLock::isEngaged() {
  const auto capabilities = _controller.ask("Get Chassis Capabilities", {chassis, getCapabilities, {}}, 1);
  if (!capabilities) return capabilities.failure();
  if ((capabilities->front() & frontPanelLockout) == 0)
    return Failure{"Get Chassis Capabilities", managementController, "it tells of no lock of the front panel",
                   std::make_error_code(std::errc::no_such_device)};
  const auto status = _controller.ask("Get Chassis Status", {chassis, getStatus, {}}, 3);
  if (!status) return status.failure();
  return ((*status)[2] & frontPanelLockout) != 0;
}

Effect EnclosureLock::setDisablesKeyboard(bool disables, const MachineHold& held) {
  // The controller may take seconds to answer.
  const auto engaged = held ? isEngaged() : Result<bool>(held.failure());
  const auto found = keyboards(_machine.root);
  const auto asked = disables && engaged.valueOr(false) ? KeyboardState::disabled : KeyboardState::enabled;
  auto setting = keyboardsUnder(engaged, found, _machine.root);
  setting.note = saying(remarkOn(engaged));
  setting.check = [](KeyboardState) -> Result<void> {
    if (const auto failure = whyNotSwitched()) return *failure;
    return {};
  };
  setting.apply = [&](KeyboardState state) { return setAll(_machine.root, *found, state); };
  return carryOut(setting, asked, _machine, held);
}

void EnclosureLock::tellKeyboards() {
  if (!_machine.effects.wantsValues()) return;
  const auto engaged = isEngaged();
  const auto found = keyboards(_machine.root);
  static_cast<void>(observe(keyboardsUnder(engaged, found, _machine.root), _machine.effects));
}

}  // namespace tavisk
