// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/linux/disks/DiskFacts.h"

#include <fcntl.h>
#include <linux/cdrom.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <climits>
#include <string_view>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t recordLimit = std::size_t{1} << 20U;

std::string decoded(std::string_view text) {
  std::string plain;
  while (!text.empty()) {
    unsigned char byte = 0;
    const auto digits = text.substr(std::min<std::size_t>(2, text.size()), 2);
    const bool isEscape = text.starts_with("\\x") && digits.size() == 2 &&
                          std::from_chars(digits.data(), digits.data() + 2, byte, 16).ptr == digits.data() + 2;
    plain += isEscape ? static_cast<char>(byte) : text.front();
    text.remove_prefix(isEscape ? 4 : 1);
  }
  return plain;
}

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

VolumeFacts volumeFrom(const DeviceProperties& properties) {
  return {properties.find("ID_FS_TYPE"), properties.find("ID_FS_USAGE"), properties.findEncoded("ID_FS_LABEL_ENC"),
          properties.findEncoded("ID_FS_UUID_ENC"), properties.findEncoded("ID_FS_BOOT_SYSTEM_ID")};
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
  const auto block = device.path.find("/block/");
  return device.path.substr(0, block);
}

}  // namespace

DeviceProperties DeviceProperties::ofBlockDevice(const SystemRoot& root, DeviceNumber number) {
  DeviceProperties properties;
  const auto file = "/run/udev/data/b" + std::to_string(number.major) + ":" + std::to_string(number.minor);
  for (const auto& line : split(root.read(file, recordLimit).valueOr(""), "\n")) {
    const auto equals = line.find('=');
    if (line.starts_with("E:") && equals != std::string::npos)
      properties._values[line.substr(2, equals - 2)] = line.substr(equals + 1);
  }
  return properties;
}

std::optional<std::string> DeviceProperties::find(const std::string& name) const {
  const auto found = _values.find(name);
  return found == _values.end() ? std::nullopt : std::optional(found->second);
}

bool DeviceProperties::isAnySet(const std::string& beginning) const {
  for (auto entry = _values.lower_bound(beginning); entry != _values.end(); ++entry) {
    if (!entry->first.starts_with(beginning)) return false;
    if (entry->second == "1") return true;
  }
  return false;
}

std::optional<std::string> DeviceProperties::findEncoded(const std::string& name) const {
  const auto value = find(name);
  return value ? std::optional(decoded(*value)) : std::nullopt;
}

OpticalMedium mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties) {
  if (properties.isAnySet("ID_CDROM_MEDIA_CD")) return OpticalMedium::cd;
  if (properties.isAnySet("ID_CDROM_MEDIA_DVD")) return OpticalMedium::dvd;
  if (properties.isSet("ID_CDROM_MEDIA")) return OpticalMedium::other;
  return properties.isSet("ID_CDROM") ? OpticalMedium::none : askDrive(root, node);
}

std::optional<DiskFacts> factsOf(const SystemRoot& root, const DiskName& name) {
  const BlockDevices devices(root);
  const auto device = devices.find(name);
  const bool hasNode = device && device->number.major != 0;  // the paths of a multipath device have none
  if (!hasNode || device->size == 0) return std::nullopt;
  DiskFacts facts;
  facts.device = *device;
  const auto properties = DeviceProperties::ofBlockDevice(root, device->number);
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
