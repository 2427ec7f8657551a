// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/HardDiskSleep.h"

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/OtherOwners.h"
#include "hosts/linux/power/PowerValues.h"

namespace tavisk {
namespace {

constexpr const char* never = "0";
constexpr const char* delay = "power/autosuspend_delay_ms";
constexpr const char* control = "power/control";

std::string milliseconds(const std::string& minutes) {
  return std::to_string(std::chrono::milliseconds(std::chrono::minutes(leadingInteger(minutes))).count());
}

Result<std::string> minutesOf(const SysDevice& disk) {
  const auto mode = disk.read(control);
  if (!mode) return mode.failure();
  const auto time = disk.read(delay);
  if (!time) return time.failure();
  const auto idle = leadingInteger(*time);
  return *mode == "auto" && idle >= 0 ? wholeMinutes(std::chrono::milliseconds(idle)) : never;
}

Result<void> setMinutes(const SysDevice& disk, const std::string& minutes) {
  if (minutes == never) return disk.write(control, "on");
  if (auto written = disk.write(delay, milliseconds(minutes)); !written) return written;
  return disk.write(control, "auto");
}

std::string ruleFor(const std::string& minutes) {
  const std::string disks =
      R"(ACTION=="add|change", SUBSYSTEM=="block", KERNEL=="sd*", ENV{DEVTYPE}=="disk", ATTR{removable}=="0", )"
      R"(ATTR{queue/rotational}=="1", )";
  if (minutes == never) return disks + R"(ATTR{device/power/control}="on")";
  return disks + R"(ATTR{device/power/autosuspend_delay_ms}=")" + milliseconds(minutes) +
         R"(", ATTR{device/power/control}="auto")";
}

}  // namespace

/// Where the kernel does not stop the motor itself, a suspended disk goes on turning. One attribute was split in two in
/// Linux 6.6.
bool HardDiskSleep::canStop(const SysDevice& disk) const {
  const auto folder = disk.path() + "/scsi_disk";
  for (const auto& address : _machine.root.list(folder).valueOr({})) {
    const auto scsi = SysDevice::at(_machine.root, std::string(folder).append("/").append(address));
    if (!scsi) continue;
    const auto* attribute = scsi->has("manage_runtime_start_stop") ? "manage_runtime_start_stop" : "manage_start_stop";
    return scsi->read(attribute).valueOr("") == "1";
  }
  return false;
}

std::vector<HardDiskSleep::Disk> HardDiskSleep::disks() const {
  std::vector<Disk> found;
  for (const auto& name : _machine.root.list("/sys/block").valueOr({})) {
    const auto block = SysDevice::at(_machine.root, "/sys/block/" + name);
    if (!name.starts_with("sd") || !block || block->read("removable").valueOr("") != "0" ||
        block->read("queue/rotational").valueOr("") != "1")
      continue;
    auto device = SysDevice::at(_machine.root, block->path() + "/device");
    if (device && device->read(delay) && canStop(*device)) found.push_back({name, *device});
  }
  return found;
}

std::optional<Failure> HardDiskSleep::whyNoDisk() const {
  if (!disks().empty()) return std::nullopt;
  return Failure{"find", "/sys/block/sd*", "no built-in disk here has a motor that the kernel can stop"};
}

Result<std::optional<std::string>> HardDiskSleep::live() const {
  std::vector<DeviceValue> values;
  for (const auto& disk : disks()) {
    auto minutes = minutesOf(disk.device);
    if (!minutes) return minutes.failure();
    values.push_back({disk.name, *minutes});
  }
  return std::optional(values.empty() ? never : valueOfAll(values));
}

Result<void> HardDiskSleep::apply(const std::string& minutes) const {
  Result<void> all;
  for (const auto& disk : disks())
    if (auto set = setMinutes(disk.device, minutes); !set && all) all = set;
  return all;
}

Setting<std::string> HardDiskSleep::hardDiskSleep() const {
  Setting<std::string> setting;
  setting.name = setting::hardDiskSleep;
  setting.unit = "minutes";
  setting.live = [this] { return live(); };
  setting.stored = [this] { return _rule.value(); };
  return setting;
}

Setting<std::string> HardDiskSleep::hardDiskSleepChange() const {
  auto setting = hardDiskSleep();
  setting.where = _rule.file();
  setting.note = [this](const auto&) { return _rule.note(); };
  setting.undoneBy = [this](const auto&) {
    return ownersAtWork(_machine.root, {OtherOwner::tlp, OtherOwner::laptopMode, OtherOwner::powertop,
                                        OtherOwner::smartd, OtherOwner::hdIdle});
  };
  setting.supported = [this] { return whyNoDisk(); };
  setting.store = [this](const std::string& minutes) { return _rule.write(minutes, ruleFor(minutes)); };
  setting.apply = [this](const std::string& minutes) { return apply(minutes); };
  return setting;
}

}  // namespace tavisk
