// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/HardDiskSleep.h"

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/power/OtherOwners.h"

namespace tavisk {
namespace {

constexpr const char* delay = "power/autosuspend_delay_ms";
constexpr const char* control = "power/control";

std::string milliseconds(Minutes minutes) {
  return std::to_string(std::chrono::milliseconds(minutes.duration()).count());
}

Result<Minutes> minutesOf(const SysDevice& disk) {
  const auto mode = disk.read(control);
  if (!mode) return mode.failure();
  const auto time = disk.read(delay);
  if (!time) return time.failure();
  return *mode == "auto" ? Minutes::covering(std::chrono::milliseconds(leadingInteger(*time))) : Minutes{};
}

Result<void> setMinutes(const SysDevice& disk, Minutes minutes) {
  if (minutes.isNever()) return disk.write(control, "on");
  if (auto written = disk.write(delay, milliseconds(minutes)); !written) return written;
  return disk.write(control, "auto");
}

std::string ruleFor(Minutes minutes) {
  const std::string disks =
      R"(ACTION=="add|change", SUBSYSTEM=="block", KERNEL=="sd*", ENV{DEVTYPE}=="disk", ATTR{removable}=="0", )"
      R"(ATTR{queue/rotational}=="1", )";
  if (minutes.isNever()) return disks + R"(ATTR{device/power/control}="on")";
  return disks + R"(ATTR{device/power/autosuspend_delay_ms}=")" + milliseconds(minutes) +
         R"(", ATTR{device/power/control}="auto")";
}

}  // namespace

/// Where the kernel does not stop the motor itself, a suspended disk goes on turning. One attribute was split in two in
/// Linux 6.6.
bool HardDiskSleep::canStop(const SysDevice& disk) const {
  const auto folder = disk.path() + "/scsi_disk";
  for (const auto& address : _machine.root.list(folder).valueOr({})) {
    const auto scsi =
        SysDevice::at(_machine.root, std::string(folder).append("/").append(address)).valueOr(std::nullopt);
    if (!scsi) continue;
    const auto* attribute =
        scsi->has("manage_runtime_start_stop").valueOr(false) ? "manage_runtime_start_stop" : "manage_start_stop";
    return scsi->read(attribute).valueOr("") == "1";
  }
  return false;
}

std::vector<HardDiskSleep::Disk> HardDiskSleep::disks() const {
  std::vector<Disk> found;
  for (const auto& name : _machine.root.list("/sys/block").valueOr({})) {
    const auto block = SysDevice::at(_machine.root, "/sys/block/" + name).valueOr(std::nullopt);
    if (!name.starts_with("sd") || !block || block->read("removable").valueOr("") != "0" ||
        block->read("queue/rotational").valueOr("") != "1")
      continue;
    auto device = SysDevice::at(_machine.root, block->path() + "/device").valueOr(std::nullopt);
    if (device && device->read(delay) && canStop(*device)) found.push_back({name, *device});
  }
  return found;
}

std::optional<Failure> HardDiskSleep::whyNoDisk() const {
  if (!disks().empty()) return std::nullopt;
  return Failure{"find", "/sys/block/sd*", "no built-in disk here has a motor that the kernel can stop"};
}

Setting<Minutes>::Found HardDiskSleep::live() const {
  std::vector<DeviceValue<Minutes>> values;
  for (const auto& disk : disks()) {
    const auto minutes = minutesOf(disk.device);
    if (!minutes) return minutes.failure();
    values.push_back({disk.name, *minutes});
  }
  return readingOfAll(std::move(values)).value_or(Minutes{});
}

Result<void> HardDiskSleep::apply(Minutes asked) const {
  return setEach(disks(), [asked](const Disk& disk) { return setMinutes(disk.device, asked); });
}

Setting<Minutes> HardDiskSleep::hardDiskSleep() const {
  Setting<Minutes> setting;
  setting.name = setting::hardDiskSleep;
  setting.unit = "minutes";
  setting.where = _rule.file();
  setting.note = [this](Minutes) { return whyNoRuleLasts(_machine.root); };
  setting.undoneBy = [this](Minutes) {
    return ownersAtWork(_machine.root, {OtherOwner::tlp, OtherOwner::laptopMode, OtherOwner::powertop,
                                        OtherOwner::smartd, OtherOwner::hdIdle});
  };
  setting.supported = [this] { return asSupport(whyNoDisk()); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return _rule.value(); };
  setting.store = [this](Minutes asked) { return _rule.write(asked, ruleFor(asked)); };
  setting.apply = [this](Minutes asked) { return apply(asked); };
  return setting;
}

}  // namespace tavisk
