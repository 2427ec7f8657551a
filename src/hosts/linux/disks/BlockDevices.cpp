// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/BlockDevices.h"

#include <algorithm>
#include <array>
#include <functional>
#include <span>
#include <string_view>
#include <utility>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::size_t attributeLimit = 4096;
constexpr unsigned usualBlockSize = 512;
constexpr int deepestMapping = 16;
constexpr unsigned floppyMajor = 2;

bool isFileName(const std::string& text) {
  return !text.empty() && text != "." && text != ".." &&
         text.find_first_of(std::string_view("/\0", 2)) == std::string::npos;
}

/// The value of a line "KEY=value".
std::string valueIn(const std::string& lines, std::string_view key) {
  for (const auto& line : configurationLines(lines))
    if (const auto named = namedValueIn(line); named && named->name == key) return named->value;
  return "";
}

/// The disk that a partition's folder lies in.
DiskName diskAbove(const std::string& path) {
  return {baseName(parentFolder(path))};
}

struct Sign {
  std::string_view text;
  const char* transport;
};

/// Devices by the beginnings of their names.
constexpr std::array namesOfDevices = {Sign{"loop", transport::diskImage}, Sign{"nbd", transport::network},
                                       Sign{"rbd", transport::network}, Sign{"drbd", transport::network}};
/// Folders above a disk in the device tree, by the beginnings of their names: what is nearer to the hardware than the
/// layer that SCSI makes of it.
constexpr std::array namesOfCarriers = {Sign{"session", transport::iscsi}, Sign{"ata", "SATA"},
                                        Sign{"end_device-", "SAS"}, Sign{"rport-", "Fibre Channel"}};
constexpr std::array subsystems = {
    Sign{"nvme", "NVMe"}, Sign{"nvme-subsystem", "NVMe"}, Sign{"mmc", "MMC"},      Sign{"firewire", "FireWire"},
    Sign{"xen", "Xen"},   Sign{"scsi", "SCSI"},           Sign{"virtio", "Virtio"}};

/// "ata1" begins with "ata" and goes on with a number.
bool isNumbered(const std::string& name, std::string_view beginning) {
  return name.starts_with(beginning) && name.find_first_of("0123456789") == beginning.size();
}

/// Null when there is no such sign.
const char* byNumberedName(std::span<const Sign> signs, const std::string& name) {
  const auto sign = std::ranges::find_if(
      signs, [&](auto text) { return isNumbered(name, text); }, &Sign::text);
  return sign == signs.end() ? nullptr : sign->transport;
}

/// Null when there is no such sign.
const char* bySubsystem(const std::string& name) {
  const auto* sign = std::ranges::find(subsystems, name, &Sign::text);
  return sign == subsystems.end() ? nullptr : sign->transport;
}

bool isRemote(const std::string& transport) {
  return transport == transport::iscsi || transport == transport::network || transport == transport::diskImage;
}

/// A question about devices, which may take many reads. What has gone reads as nothing; the first read that fails makes
/// the whole answer a failure.
class DeviceLook {
 public:
  explicit DeviceLook(const SystemRoot& root) : _root(root) {}

  template <typename Value>
  Result<Value> told(Value answer) {
    if (_failure) return *std::move(_failure);
    return answer;
  }

  std::vector<DiskName> list();
  std::optional<BlockDevice> find(const DiskName& name);
  std::optional<BlockDevice> withNumber(DeviceNumber number);
  std::optional<BlockDevice> withNode(const std::string& node);
  DiskName wholeDisk(const DiskName& name);
  std::optional<Mapping> mappingOf(const BlockDevice& device);
  bool isCarrying(const BlockDevice& device);
  unsigned logicalBlockSize(const DiskName& disk);
  bool answersReads(const BlockDevice& device);
  bool isRemovable(const DiskName& disk);
  bool isOptical(const DiskName& disk);
  std::string transportOf(const DiskName& disk);
  bool isInternal(const DiskName& disk);

 private:
  template <typename Value>
  Value seen(Result<Value> read) {
    if (read) return std::move(read).value();
    if (!_failure && !isGone(read.failure())) _failure = read.failure();
    return Value();
  }
  std::string attribute(const std::string& path, const char* name);
  std::uint64_t count(const std::string& path, const char* name);
  std::string subsystemOf(const std::string& path);
  std::optional<std::string> pathOf(const DiskName& name);
  std::optional<DiskName> firstBeneath(const std::string& path);
  std::vector<std::string> carriersOf(const DiskName& disk);

  const SystemRoot& _root;
  std::optional<Failure> _failure;
};

std::vector<DiskName> DeviceLook::list() {
  std::vector<DiskName> names;
  for (auto& name : seen(_root.list("/sys/class/block"))) names.push_back({std::move(name)});
  return names;
}

std::optional<std::string> DeviceLook::pathOf(const DiskName& name) {
  constexpr std::string_view upToSys = "../..";
  if (!isFileName(name.text)) return std::nullopt;
  const auto target = seen(_root.readLink("/sys/class/block/" + name.text));
  if (!target.starts_with("../../devices/")) return std::nullopt;
  return target.substr(upToSys.size());
}

/// Without the newline; empty when there is none.
std::string DeviceLook::attribute(const std::string& path, const char* name) {
  auto text = seen(_root.read("/sys" + path + "/" + name, attributeLimit));
  while (text.ends_with('\n')) text.pop_back();
  return text;
}

std::uint64_t DeviceLook::count(const std::string& path, const char* name) {
  return parseNumber<std::uint64_t>(attribute(path, name)).value_or(0);
}

std::optional<BlockDevice> DeviceLook::find(const DiskName& name) {
  const auto path = pathOf(name);
  if (!path) return std::nullopt;
  const auto uevent = attribute(*path, "uevent");
  BlockDevice device;
  device.name = device.disk = name;
  device.number = DeviceNumber::parse(valueIn(uevent, "MAJOR") + ":" + valueIn(uevent, "MINOR"));
  device.path = *path;
  device.node = "/dev/" + valueIn(uevent, "DEVNAME");
  device.partition = static_cast<int>(count(*path, "partition"));
  if (device.partition != 0) {
    device.disk = diskAbove(*path);
    device.start = count(*path, "start");
  }
  device.size = count(*path, "size");
  device.writable = attribute(*path, "ro") != "1";
  return device;
}

std::optional<BlockDevice> DeviceLook::withNumber(DeviceNumber number) {
  const auto link = "/sys/dev/block/" + std::to_string(number.major) + ":" + std::to_string(number.minor);
  const auto target = seen(_root.readLink(link));
  return target.empty() ? std::nullopt : find({baseName(target)});
}

std::optional<BlockDevice> DeviceLook::withNode(const std::string& node) {
  constexpr std::string_view folder = "/dev/";
  const auto path = seen(_root.standardized(node));
  if (!path.starts_with(folder)) return std::nullopt;
  auto name = path.substr(folder.size());
  std::ranges::replace(name, '/', '!');  // sysfs has "cciss!c0d0" for /dev/cciss/c0d0
  return find({name});
}

/// The first of the devices that a mapped volume or an array is on.
std::optional<DiskName> DeviceLook::firstBeneath(const std::string& path) {
  const auto names = seen(_root.list("/sys" + path + "/slaves"));
  return names.empty() ? std::nullopt : std::optional(DiskName{names.front()});
}

DiskName DeviceLook::wholeDisk(const DiskName& name) {
  auto disk = name;
  for (int depth = 0; depth < deepestMapping; ++depth) {
    const auto path = pathOf(disk);
    if (!path) return disk;
    const bool isPartition = seen(_root.isThere("/sys" + *path + "/partition"));
    const auto beneath = isPartition ? diskAbove(*path) : firstBeneath(*path);
    if (!beneath) return disk;
    disk = *beneath;
  }
  return disk;
}

std::optional<Mapping> DeviceLook::mappingOf(const BlockDevice& device) {
  auto name = attribute(device.path, "dm/name");
  if (name.empty()) return std::nullopt;
  return Mapping{std::move(name), attribute(device.path, "dm/uuid")};
}

bool DeviceLook::isCarrying(const BlockDevice& device) {
  return !seen(_root.list("/sys" + device.path + "/holders")).empty();
}

unsigned DeviceLook::logicalBlockSize(const DiskName& disk) {
  const auto size = count(pathOf(disk).value_or(""), "queue/logical_block_size");
  return size != 0 ? static_cast<unsigned>(size) : usualBlockSize;
}

bool DeviceLook::answersReads(const BlockDevice& device) {
  return device.number.major != floppyMajor && attribute(device.path, "dm/suspended") != "1";
}

bool DeviceLook::isRemovable(const DiskName& disk) {
  return attribute(pathOf(disk).value_or(""), "removable") == "1";
}

bool DeviceLook::isOptical(const DiskName& disk) {
  constexpr const char* scsiOptical = "5";  // a peripheral device type of SCSI
  const auto path = pathOf(disk);
  return path && (disk.text.starts_with("sr") || attribute(*path, "device/type") == scsiOptical);
}

/// The folders of the device tree above a disk, the nearest first.
std::vector<std::string> DeviceLook::carriersOf(const DiskName& disk) {
  constexpr std::string_view top = "/devices";
  std::vector<std::string> carriers;
  auto path = pathOf(disk).value_or("");
  while (path.size() > top.size()) {
    path.resize(path.rfind('/'));
    if (path.size() > top.size()) carriers.push_back(path);
  }
  return carriers;
}

std::string DeviceLook::subsystemOf(const std::string& path) {
  return baseName(seen(_root.readLink("/sys" + path + "/subsystem")));
}

std::string DeviceLook::transportOf(const DiskName& disk) {
  const auto path = pathOf(disk);
  if (!path) return "";
  if (const auto* found = byNumberedName(namesOfDevices, disk.text)) return found;
  const char* carried = nullptr;
  for (const auto& carrier : carriersOf(disk)) {
    if (const auto* found = byNumberedName(namesOfCarriers, baseName(carrier))) return found;
    const auto subsystem = subsystemOf(carrier);
    if (subsystem == "usb") return transport::usb;
    if (subsystem == "nvme-fabrics") return transport::network;
    // The nearest one counts, unless something further up tells more.
    if (!carried) carried = bySubsystem(subsystem);
  }
  return carried ? carried : "";
}

bool DeviceLook::isInternal(const DiskName& disk) {
  if (!pathOf(disk) || isRemovable(disk)) return false;
  const auto transport = transportOf(disk);
  if (isRemote(transport)) return false;
  for (const auto& carrier : carriersOf(disk)) {
    const auto removable = attribute(carrier, "removable");  // of USB and PCI devices
    if (removable == "removable") return false;
    if (transport == transport::usb && !removable.empty()) return removable == "fixed";
  }
  return transport != transport::usb;
}

/// One question, and what came in its way.
template <typename Question, typename... Asked>
auto answer(const SystemRoot& root, Question question, const Asked&... asked) {
  DeviceLook look(root);
  return look.told((look.*question)(asked...));
}

}  // namespace

Result<std::vector<DiskName>> BlockDevices::list() const {
  return answer(_root, &DeviceLook::list);
}

Result<std::optional<BlockDevice>> BlockDevices::find(const DiskName& name) const {
  return answer(_root, &DeviceLook::find, name);
}

Result<std::optional<BlockDevice>> BlockDevices::withNumber(DeviceNumber number) const {
  return answer(_root, &DeviceLook::withNumber, number);
}

Result<std::optional<BlockDevice>> BlockDevices::withNode(const std::string& node) const {
  return answer(_root, &DeviceLook::withNode, node);
}

Result<DiskName> BlockDevices::wholeDisk(const DiskName& name) const {
  return answer(_root, &DeviceLook::wholeDisk, name);
}

Result<std::optional<Mapping>> BlockDevices::mappingOf(const BlockDevice& device) const {
  return answer(_root, &DeviceLook::mappingOf, device);
}

Result<bool> BlockDevices::isCarrying(const BlockDevice& device) const {
  return answer(_root, &DeviceLook::isCarrying, device);
}

Result<unsigned> BlockDevices::logicalBlockSize(const DiskName& disk) const {
  return answer(_root, &DeviceLook::logicalBlockSize, disk);
}

Result<bool> BlockDevices::answersReads(const BlockDevice& device) const {
  return answer(_root, &DeviceLook::answersReads, device);
}

Result<bool> BlockDevices::isRemovable(const DiskName& disk) const {
  return answer(_root, &DeviceLook::isRemovable, disk);
}

Result<bool> BlockDevices::isOptical(const DiskName& disk) const {
  return answer(_root, &DeviceLook::isOptical, disk);
}

Result<std::string> BlockDevices::transportOf(const DiskName& disk) const {
  return answer(_root, &DeviceLook::transportOf, disk);
}

Result<bool> BlockDevices::isInternal(const DiskName& disk) const {
  return answer(_root, &DeviceLook::isInternal, disk);
}

}  // namespace tavisk
