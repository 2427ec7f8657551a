// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/HardDiskSleep.h"

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/power/OtherOwners.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* delay = "power/autosuspend_delay_ms";
constexpr const char* control = "power/control";

std::string milliseconds(Minutes minutes) {
  return std::to_string(std::chrono::milliseconds(minutes.duration()).count());
}

Result<std::optional<Minutes>> timerOf(const SysDevice& disk) {
  const auto mode = orGone(disk.read(control));
  if (!mode) return mode.failure();
  const auto time = orGone(disk.read(delay));
  if (!time) return time.failure();
  if (!*mode || !*time) return std::nullopt;
  return **mode == "auto" ? Minutes::covering(std::chrono::milliseconds(leadingInteger(**time))) : Minutes{};
}

Result<void> setMinutes(const SysDevice& disk, Minutes minutes) {
  if (minutes.isNever()) return disk.write(control, "on");
  if (auto written = disk.write(delay, milliseconds(minutes)); !written) return written;
  return disk.write(control, "auto");
}

std::string diskRule(Minutes minutes) {
  const std::string disks =
      R"(ACTION=="add|change", SUBSYSTEM=="block", KERNEL=="sd*", ENV{DEVTYPE}=="disk", ATTR{removable}=="0", )"
      R"(ATTR{queue/rotational}=="1", )";
  if (minutes.isNever()) return disks + R"(ATTR{device/power/control}="on")";
  return disks + R"(ATTR{device/power/autosuspend_delay_ms}=")" + milliseconds(minutes) +
         R"(", ATTR{device/power/control}="auto")";
}

/// The kernel answers EIO for a device that is not suspended after a while
/// (Documentation/ABI/testing/sysfs-devices-power), and does so again; an error that passes is no answer.
Result<bool> canWait(const SysDevice& disk) {
  auto time = orGone(disk.read(delay));
  const auto isRefused = [&] { return !time && time.failure().code == std::errc::io_error; };
  if (isRefused()) time = orGone(disk.read(delay));
  if (isRefused()) return false;
  if (!time) return time.failure();
  return time->has_value();
}

/// Where the kernel does not stop the motor itself, a suspended disk goes on turning. One attribute was split in two in
/// Linux 6.6.
Result<bool> canStop(const SysDevice& disk) {
  const auto addresses = disk.list("scsi_disk");
  if (!addresses) return addresses.failure();
  if (addresses->empty()) return false;
  const auto folder = "scsi_disk/" + addresses->front();
  const auto attribute = orGone(disk.read(folder + "/manage_runtime_start_stop"));
  if (!attribute) return attribute.failure();
  return *attribute ? **attribute == "1" : disk.says(folder + "/manage_start_stop", "1");
}

}  // namespace

HardDiskSleep::HardDiskSleep(const LinuxMachine& machine)
    : _machine(machine), _rule(machine.root, "disk-sleep", diskRule) {}

Result<std::optional<HardDiskSleep::Disk>> HardDiskSleep::stoppableDisk(const std::string& name) const {
  if (!name.starts_with("sd")) return std::nullopt;
  const auto block = SysDevice::at(_machine.root, "/sys/block/" + name);
  const auto disk = SysDevice::at(_machine.root, "/sys/block/" + name + "/device");
  if (!block || !disk) return (block ? disk : block).failure();
  if (!*block || !*disk) return std::nullopt;
  const auto stops = allHold({[&] { return (*block)->says("removable", "0"); },
                              [&] { return (*block)->says("queue/rotational", "1"); }, [&] { return canStop(**disk); },
                              [&] { return canWait(**disk); }});
  if (!stops) return stops.failure();
  return *stops ? std::optional(Disk{name, **disk}) : std::nullopt;
}

Result<std::vector<HardDiskSleep::Disk>> HardDiskSleep::disks() const {
  return ofEachIn(_machine.root, "/sys/block", [this](const std::string& name) { return stoppableDisk(name); });
}

Support HardDiskSleep::supported() const {
  return supportBy(disks(), {"find", "/sys/block/sd*", "no built-in disk here has a motor that the kernel can stop"});
}

Setting<Minutes>::Found HardDiskSleep::live() const {
  const auto found =
      readingOfAll(ofEach(disks(), [](const Disk& disk) { return on(disk.name, timerOf(disk.device)); }));
  if (!found) return found.failure();
  return found->value_or(Minutes{});
}

Result<void> HardDiskSleep::apply(Minutes asked) const {
  return setEach(disks(), [asked](const Disk& disk) { return setMinutes(disk.device, asked); });
}

std::string HardDiskSleep::whatUndoes() const {
  auto owners = ownersAtWork(_machine.root, {OtherOwner::tlp, OtherOwner::laptopMode, OtherOwner::powertop,
                                             OtherOwner::smartd, OtherOwner::hdIdle});
  return owners.empty() ? laterRules(_machine.root, _rule.file(), {"\"block\"", R"(device/power/control}=")"}) : owners;
}

Setting<Minutes> HardDiskSleep::hardDiskSleep() const {
  Setting<Minutes> setting;
  setting.name = setting::hardDiskSleep;
  setting.unit = "minutes";
  setting.undoneBy = [this](Minutes) { return whatUndoes(); };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.apply = [this](Minutes asked) { return apply(asked); };
  // The kernel lets no disk sleep by itself.
  setting.withoutStored = Minutes{};
  keepBy(_rule, _machine.root, setting);
  return setting;
}

}  // namespace tavisk
