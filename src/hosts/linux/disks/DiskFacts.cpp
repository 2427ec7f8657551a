// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/DiskFacts.h"

#include <fcntl.h>
#include <linux/cdrom.h>
#include <sys/ioctl.h>

#include <array>
#include <climits>
#include <map>
#include <string_view>

#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"

namespace tavisk {
namespace {

constexpr std::size_t recordLimit = std::size_t{1} << 20U;

/// Blanks and special characters are written as \x20.
std::string unescaped(std::string_view text) {
  constexpr std::string_view sign = "\\x";
  constexpr std::size_t digitCount = 2;
  std::string plain;
  while (!text.empty()) {
    const auto digits = text.starts_with(sign) ? text.substr(sign.size(), digitCount) : std::string_view();
    const auto byte = digits.size() == digitCount ? parseNumber<unsigned char>(digits, 16) : std::nullopt;
    plain += byte ? static_cast<char>(*byte) : text.front();
    text.remove_prefix(byte ? sign.size() + digitCount : 1);
  }
  return plain;
}

/// What the device manager has found out about one device and keeps in /run/udev: its properties, by the names that
/// `udevadm info` shows. Nothing where no device manager runs.
class DeviceProperties {
 public:
  DeviceProperties(const SystemRoot& root, DeviceNumber number) {
    constexpr std::string_view mark = "E:";
    const auto file = "/run/udev/data/b" + std::to_string(number.major) + ":" + std::to_string(number.minor);
    for (const auto& line : configurationLines(root.read(file, recordLimit).valueOr("")))
      if (auto property = namedValueIn(line); property && property->name.starts_with(mark))
        _values[property->name.substr(mark.size())] = std::move(property->value);
  }

  std::optional<std::string> find(const std::string& name) const {
    const auto found = _values.find(name);
    return found == _values.end() ? std::nullopt : std::optional(found->second);
  }
  std::optional<std::string> findEscaped(const std::string& name) const {
    const auto value = find(name);
    return value ? std::optional(unescaped(*value)) : std::nullopt;
  }
  bool isSet(const std::string& name) const { return find(name) == "1"; }
  /// Whether one of those whose names begin so is.
  bool isAnySet(const std::string& beginning) const {
    for (auto entry = _values.lower_bound(beginning); entry != _values.end(); ++entry) {
      if (!entry->first.starts_with(beginning)) return false;
      if (entry->second == "1") return true;
    }
    return false;
  }

 private:
  std::map<std::string, std::string> _values;
};

/// The number of a kind of medium, as MMC's GET CONFIGURATION has it; 0 when the drive does not say.
unsigned currentProfile(const FileDescriptor& drive) {
  std::array<unsigned char, 8> header{};
  cdrom_generic_command command{};
  command.cmd[0] = GPCMD_GET_CONFIGURATION;
  command.cmd[8] = header.size();
  command.buffer = header.data();
  command.buflen = header.size();
  command.data_direction = CGC_DATA_READ;
  command.quiet = 1;
  command.timeout = 500;  // hundredths of a second
  if (::ioctl(drive.number(), CDROM_SEND_PACKET, &command) != 0) return 0;
  return static_cast<unsigned>(header[6]) << 8U | header[7];
}

OpticalMedium mediumOfProfile(unsigned profile) {
  if (profile >= 0x08 && profile <= 0x0A) return OpticalMedium::cd;
  if ((profile >= 0x10 && profile <= 0x1B) || profile == 0x2A || profile == 0x2B) return OpticalMedium::dvd;
  return OpticalMedium::other;
}

OpticalMedium askDrive(const SystemRoot& root, const std::string& node) {
  const auto drive = root.open(node, O_RDONLY | O_NONBLOCK);
  if (!drive) return OpticalMedium::none;
  const int status = ::ioctl(drive->number(), CDROM_DRIVE_STATUS, CDSL_CURRENT);
  if (status == CDS_NO_DISC || status == CDS_TRAY_OPEN || status == CDS_DRIVE_NOT_READY) return OpticalMedium::none;
  return mediumOfProfile(currentProfile(*drive));
}

/// From the device manager, else from the drive itself.
OpticalMedium mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties) {
  if (properties.isAnySet("ID_CDROM_MEDIA_CD")) return OpticalMedium::cd;
  if (properties.isAnySet("ID_CDROM_MEDIA_DVD")) return OpticalMedium::dvd;
  if (properties.isSet("ID_CDROM_MEDIA")) return OpticalMedium::other;
  return properties.isSet("ID_CDROM") ? OpticalMedium::none : askDrive(root, node);
}

VolumeFacts volumeFrom(const DeviceProperties& properties) {
  return {properties.find("ID_FS_TYPE"), properties.find("ID_FS_USAGE"), properties.findEscaped("ID_FS_LABEL_ENC"),
          properties.findEscaped("ID_FS_UUID_ENC"), properties.findEscaped("ID_FS_BOOT_SYSTEM_ID")};
}

void readDisk(const SystemRoot& root, DiskFacts& facts) {
  if (!BlockDevices(root).answersReads(facts.device)) {
    facts.unread = Failure{"read", facts.device.node, "it would not answer"};
    return;
  }
  const auto volume = probeVolume(root, facts.device.node);
  if (volume) facts.volume = *volume;
  const auto table = facts.device.partition == 0 ? probePartitionTable(root, facts.device.node) : PartitionTable{};
  if (table) facts.table = *table;
  if (!volume) facts.unread = volume.failure();
}

/// What is above the disk in the device tree.
std::string carrierOf(const BlockDevice& device) {
  return device.path.substr(0, device.path.find("/block/"));
}

}  // namespace

std::optional<DiskFacts> factsOf(const SystemRoot& root, const DiskName& name) {
  const BlockDevices devices(root);
  const auto device = devices.find(name);
  const bool hasNode = device && device->number.major != 0;  // the paths of a multipath device have none
  if (!hasNode || device->size == 0) return std::nullopt;
  DiskFacts facts;
  facts.device = *device;
  const DeviceProperties properties(root, device->number);
  if (devices.isOptical(device->disk)) {
    facts.medium = mediumIn(root, device->node, properties);
    if (facts.medium == OpticalMedium::none) return std::nullopt;
  }
  facts.busPath = properties.find("ID_PATH").value_or(carrierOf(*device));
  facts.partitionType = properties.find("ID_PART_ENTRY_TYPE");
  if (properties.find("ID_FS_TYPE") || properties.find("ID_PART_TABLE_TYPE")) {
    facts.volume = volumeFrom(properties);
    facts.table.type = properties.find("ID_PART_TABLE_TYPE").value_or("");
  } else {
    readDisk(root, facts);
  }
  return facts;
}

}  // namespace tavisk
