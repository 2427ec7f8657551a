// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/WakeOnModem.h"

#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"

namespace tavisk {
namespace {

constexpr const char* terminals = "/sys/class/tty";
constexpr const char* enabled = "enabled";

const char* wordFor(bool wakes) {
  return wakes ? enabled : "disabled";
}

/// The place of a serial port on the board, if the port can wake the machine from there.
Result<std::optional<SysDevice>> wakingPlace(Result<std::optional<SysDevice>> device) {
  while (device && *device) {
    const auto subsystem = (*device)->subsystem();
    if (!subsystem) return subsystem.failure();
    const auto wakes = *subsystem == "pnp" ? (*device)->canWake() : Result<bool>(false);
    if (!wakes) return wakes.failure();
    if (*wakes) break;
    device = (*device)->parent();
  }
  return device;
}

std::string ruleFor(bool wakes) {
  return R"(ACTION!="remove", SUBSYSTEM=="pnp", DRIVER=="serial", TEST=="power/wakeup", ATTR{power/wakeup}=")" +
         std::string(wordFor(wakes)) + "\"";
}

}  // namespace

std::vector<WakeOnModem::Port> WakeOnModem::ports() const {
  std::vector<Port> found;
  for (const auto& terminal : _machine.root.list(terminals).valueOr({})) {
    if (!terminal.starts_with("ttyS")) continue;
    const auto device = (std::string(terminals) + "/").append(terminal).append("/device");
    const auto place = wakingPlace(SysDevice::at(_machine.root, device));
    if (place && *place) found.push_back({terminal, **place});
  }
  return found;
}

std::optional<Failure> WakeOnModem::whyNoPort() const {
  if (!ports().empty()) return std::nullopt;
  return Failure{"find", std::string(terminals) + "/ttyS*", "no serial port here can wake the machine"};
}

Setting<bool>::Found WakeOnModem::live() const {
  std::vector<DeviceValue<bool>> values;
  for (const auto& port : ports()) {
    const auto word = port.place.read(wakeSwitch);
    if (!word) return word.failure();
    values.push_back({port.terminal, *word == enabled});
  }
  return readingOfAll(std::move(values));
}

Result<void> WakeOnModem::apply(bool wakes) const {
  return setEach(ports(), [wakes](const Port& port) { return port.place.write(wakeSwitch, wordFor(wakes)); });
}

Setting<bool> WakeOnModem::wakeOnModem() const {
  Setting<bool> setting;
  setting.name = setting::wakeOnModem;
  setting.where = _rule.file();
  setting.note = [this](bool) { return whyNoRuleLasts(_machine.root); };
  setting.supported = [this] { return asSupport(whyNoPort()); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return _rule.value(); };
  setting.store = [this](bool wakes) { return _rule.write(wakes, ruleFor(wakes)); };
  setting.apply = [this](bool wakes) { return apply(wakes); };
  return setting;
}

}  // namespace tavisk
