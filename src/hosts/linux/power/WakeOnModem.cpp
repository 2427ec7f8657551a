// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/WakeOnModem.h"

#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* terminals = "/sys/class/tty";
constexpr const char* enabled = "enabled";

const char* wordFor(bool wakes) {
  return wakes ? enabled : "disabled";
}

/// The place of a serial port on the board, if the port can wake the machine from there.
Result<std::optional<SysDevice>> wakingPlace(std::optional<SysDevice> device) {
  for (; device; device = device->parent()) {
    const auto subsystem = device->subsystem();
    if (!subsystem) return subsystem.failure();
    const auto canWake = device->canWake();
    if (!canWake) return canWake.failure();
    if (*subsystem == "pnp" && *canWake) break;
  }
  return device;
}

Result<std::optional<bool>> wakes(const SysDevice& place) {
  const auto word = orGone(place.read(wakeSwitch));
  if (!word) return word.failure();
  return *word ? std::optional(**word == enabled) : std::nullopt;
}

std::string serialPortRule(bool wakes) {
  return R"(ACTION!="remove", SUBSYSTEM=="pnp", DRIVER=="serial", TEST=="power/wakeup", ATTR{power/wakeup}=")" +
         std::string(wordFor(wakes)) + "\"";
}

}  // namespace

WakeOnModem::WakeOnModem(const LinuxMachine& machine)
    : _machine(machine), _rule(machine.root, "wake-on-ring", serialPortRule) {}

Result<std::optional<WakeOnModem::Port>> WakeOnModem::wakingPort(const std::string& terminal) const {
  if (!terminal.starts_with("ttyS")) return std::nullopt;
  const auto device = SysDevice::at(_machine.root, (std::string(terminals) + "/").append(terminal).append("/device"));
  if (!device) return device.failure();
  const auto place = wakingPlace(*device);
  if (!place) return place.failure();
  return *place ? std::optional(Port{terminal, **place}) : std::nullopt;
}

Result<std::vector<WakeOnModem::Port>> WakeOnModem::ports() const {
  return ofEachIn(_machine.root, terminals, [this](const std::string& terminal) { return wakingPort(terminal); });
}

Support WakeOnModem::supported() const {
  return supportBy(ports(), {"find", std::string(terminals) + "/ttyS*", "no serial port here can wake the machine"});
}

Setting<bool>::Found WakeOnModem::live() const {
  return readingOfAll(ofEach(ports(), [](const Port& port) { return on(port.terminal, wakes(port.place)); }));
}

Result<void> WakeOnModem::apply(bool wakes) const {
  return setEach(ports(), [wakes](const Port& port) { return port.place.write(wakeSwitch, wordFor(wakes)); });
}

Setting<bool> WakeOnModem::wakeOnModem() const {
  Setting<bool> setting;
  setting.name = setting::wakeOnModem;
  setting.undoneBy = [this](bool) {
    return laterRules(_machine.root, _rule.file(), {"\"pnp\"", R"(power/wakeup}=")"});
  };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.apply = [this](bool wakes) { return apply(wakes); };
  // The kernel has no port wake the machine by itself.
  setting.withoutStored = false;
  keepBy(_rule, _machine.root, setting);
  return setting;
}

}  // namespace tavisk
