// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/WakeOnModem.h"

#include "effects/SettingNames.h"
#include "hosts/linux/power/PowerValues.h"

namespace tavisk {
namespace {

constexpr const char* terminals = "/sys/class/tty";
constexpr const char* wakeup = "power/wakeup";

const char* wordFor(const std::string& value) {
  return isOn(value) ? "enabled" : "disabled";
}

/// The place of a serial port on the board, if the port can wake the machine from there.
std::optional<SysDevice> wakingPlace(std::optional<SysDevice> device) {
  while (device && !(device->subsystem() == "pnp" && device->canWake())) device = device->parent();
  return device;
}

std::string ruleFor(const std::string& value) {
  return R"(ACTION!="remove", SUBSYSTEM=="pnp", DRIVER=="serial", TEST=="power/wakeup", ATTR{power/wakeup}=")" +
         std::string(wordFor(value)) + "\"";
}

}  // namespace

std::vector<WakeOnModem::Port> WakeOnModem::ports() const {
  std::vector<Port> found;
  for (const auto& terminal : _machine.root.list(terminals).valueOr({})) {
    if (!terminal.starts_with("ttyS")) continue;
    const auto device = (std::string(terminals) + "/").append(terminal).append("/device");
    if (auto place = wakingPlace(SysDevice::at(_machine.root, device))) found.push_back({terminal, *place});
  }
  return found;
}

std::optional<Failure> WakeOnModem::whyNoPort() const {
  if (!ports().empty()) return std::nullopt;
  return Failure{"find", "/sys/class/tty/ttyS*", "no serial port here can wake the machine"};
}

Result<std::optional<std::string>> WakeOnModem::live() const {
  std::vector<DeviceValue> values;
  for (const auto& port : ports()) {
    auto word = port.place.read(wakeup);
    if (!word) return word.failure();
    values.push_back({port.terminal, onOff(*word == "enabled")});
  }
  return std::optional(valueOfAll(values));
}

Result<void> WakeOnModem::apply(const std::string& value) const {
  Result<void> all;
  for (const auto& port : ports())
    if (auto set = port.place.write(wakeup, wordFor(value)); !set && all) all = set;
  return all;
}

Setting<std::string> WakeOnModem::wakeOnModem() const {
  Setting<std::string> setting;
  setting.name = setting::wakeOnModem;
  setting.supported = [this] { return whyNoPort(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return _rule.value(); };
  return setting;
}

Setting<std::string> WakeOnModem::wakeOnModemChange() const {
  auto setting = wakeOnModem();
  setting.where = _rule.file();
  setting.note = [this](const auto&) { return _rule.note(); };
  setting.store = [this](const std::string& value) { return _rule.write(value, ruleFor(value)); };
  setting.apply = [this](const std::string& value) { return apply(value); };
  return setting;
}

}  // namespace tavisk
