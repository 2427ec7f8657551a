// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/linux/machine/KeyboardLock.h"

#include <algorithm>
#include <charconv>
#include <cstdint>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/OnOff.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

constexpr const char* devices = "/sys/class/input/";

std::string valueOf(const SystemRoot& root, const std::string& file) {
  return readKernelFile(root, file).valueOr("");
}

/// Whether it has the keys Escape to D, bits 1 to 31: by these udev knows keyboards from buttons too.
bool hasLetters(const SystemRoot& root, const std::string& device) {
  constexpr std::uint64_t letters = 0xFFFF'FFFE;
  const auto words = split(valueOf(root, device + "/capabilities/key"), " ");
  if (words.empty()) return false;
  std::uint64_t keys = 0;
  const auto& last = words.back();
  std::from_chars(last.data(), last.data() + last.size(), keys, 16);
  return (keys & letters) == letters;
}

/// Vendor and product of the USB keyboards that management controllers have, where their names do not say so.
constexpr std::string_view controllersOwn[] = {"046b:ff10", "0557:2221", "0557:2419", "0624:0249", "03f0:7029"};

bool isOfController(const SystemRoot& root, const std::string& device) {
  if (lowerCased(valueOf(root, device + "/name")).find("virtual") != std::string::npos) return true;
  const auto id = valueOf(root, device + "/id/vendor") + ":" + valueOf(root, device + "/id/product");
  return std::ranges::find(controllersOwn, id) != std::end(controllersOwn);
}

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

std::vector<std::string> keyboards(const SystemRoot& root) {
  std::vector<std::string> found;
  for (const auto& name : root.list(devices).valueOr({})) {
    const auto device = devices + name;
    if (name.starts_with("input") && hasLetters(root, device) && !isOfController(root, device)) found.push_back(device);
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
    return Failure{"Get Chassis Capabilities", managementController, "it tells of no lock of the front panel"};
  const auto status = _controller.ask("Get Chassis Status", {chassis, getStatus, {}}, 3);
  if (!status) return status.failure();
  return ((*status)[2] & frontPanelLockout) != 0;
}

void EnclosureLock::setDisablesKeyboard(bool disables) {
  if (const auto failure = whyNeedsRoot("disable keyboards", "/sys/class/input"))
    return _machine.effects.recordFailure(setting::keyboardLock, *failure, onOff(disables));
  const auto engaged = isEngaged();
  const auto found = keyboards(_machine.root);
  const bool inhibit = disables && engaged.valueOr(false);
  Setting<std::string> setting;
  setting.name = setting::keyboardLock;
  setting.note = [text = std::string(!engaged   ? "the preference is kept"
                                     : *engaged ? "the lock is engaged"
                                                : "the lock is open")](const auto&) { return text; };
  setting.supported = [&] { return whyNotSupported(engaged, found); };
  setting.live = [&] { return stateOf(_machine.root, found); };
  setting.apply = [&](const std::string&) { return inhibitAll(_machine.root, found, inhibit); };
  carryOut(setting, textOf(inhibit), _machine.effects, _machine.runLoop);
}

}  // namespace tavisk
