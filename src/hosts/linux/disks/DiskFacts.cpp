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
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::size_t recordLimit = std::size_t{1} << 20U;

/// What the device manager has found out about one device and keeps in /run/udev: its properties, by the names that
/// `udevadm info` shows. Nothing where no device manager runs.
class DeviceProperties {
 public:
  static Result<DeviceProperties> of(const SystemRoot& root, DeviceNumber number) {
    const auto file = "/run/udev/data/b" + std::to_string(number.major) + ":" + std::to_string(number.minor);
    const auto record = orEmpty(root.read(file, recordLimit));
    if (!record) return record.failure();
    return DeviceProperties(*record);
  }

  std::optional<std::string> find(const std::string& name) const {
    const auto found = _values.find(name);
    return found == _values.end() ? std::nullopt : std::optional(found->second);
  }
  std::optional<std::string> findEscaped(const std::string& name) const {
    const auto value = find(name);
    return value ? std::optional(withoutHexEscapes(*value)) : std::nullopt;
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
  explicit DeviceProperties(const std::string& record) {
    constexpr std::string_view mark = "E:";
    for (const auto& line : configurationLines(record))
      if (auto property = namedValueIn(line); property && property->name.starts_with(mark))
        _values[property->name.substr(mark.size())] = std::move(property->value);
  }

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

Result<OpticalMedium> askDrive(const SystemRoot& root, const std::string& node) {
  const auto drive = root.open(node, O_RDONLY | O_NONBLOCK);
  if (!drive) return isGone(drive.failure()) ? Result(OpticalMedium::none) : drive.failure();
  const int status = ::ioctl(drive->number(), CDROM_DRIVE_STATUS, CDSL_CURRENT);
  if (status == CDS_NO_DISC || status == CDS_TRAY_OPEN || status == CDS_DRIVE_NOT_READY) return OpticalMedium::none;
  return mediumOfProfile(currentProfile(*drive));
}

/// From the device manager, else from the drive itself.
Result<OpticalMedium> mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties) {
  if (properties.isAnySet("ID_CDROM_MEDIA_CD")) return OpticalMedium::cd;
  if (properties.isAnySet("ID_CDROM_MEDIA_DVD")) return OpticalMedium::dvd;
  if (properties.isSet("ID_CDROM_MEDIA")) return OpticalMedium::other;
  if (properties.isSet("ID_CDROM")) return OpticalMedium::none;
  return askDrive(root, node);
}

VolumeFacts volumeFrom(const DeviceProperties& properties) {
  return {properties.find("ID_FS_TYPE"), properties.find("ID_FS_USAGE"), properties.findEscaped("ID_FS_LABEL_ENC"),
          properties.findEscaped("ID_FS_UUID_ENC"), properties.findEscaped("ID_FS_BOOT_SYSTEM_ID")};
}

std::optional<PartitionFacts> partitionFrom(const DeviceProperties& properties, const BlockDevice& device) {
  const auto number = parseNumber<int>(properties.find("ID_PART_ENTRY_NUMBER").value_or(""));
  if (device.partition == 0 || number != device.partition) return std::nullopt;
  return PartitionFacts{device.partition,
                        device.start,
                        device.size,
                        properties.findEscaped("ID_PART_ENTRY_UUID").value_or(""),
                        properties.find("ID_PART_ENTRY_TYPE").value_or(""),
                        properties.findEscaped("ID_PART_ENTRY_NAME").value_or("")};
}

Result<void> readDisk(const SystemRoot& root, DiskFacts& facts) {
  const auto answers = BlockDevices(root).answersReads(facts.device);
  if (!answers) return answers.failure();
  if (!*answers) return Failure{"read", facts.device.node, "it would not answer"};
  const auto volume = probeVolume(root, facts.device.node);
  if (volume) facts.volume = *volume;
  const auto table = facts.device.partition == 0 ? probePartitionTable(root, facts.device.node) : PartitionTable{};
  if (table) facts.table = *table;
  if (!volume) return volume.failure();
  return table ? Result<void>() : table.failure();
}

/// What is above the disk in the device tree.
std::string carrierOf(const BlockDevice& device) {
  return device.path.substr(0, device.path.find("/block/"));
}

void readMedium(const SystemRoot& root, const DeviceProperties& properties, DiskFacts& facts) {
  const auto medium = mediumIn(root, facts.device.node, properties);
  facts.medium = medium.valueOr(OpticalMedium::other);
  if (!medium) facts.unread = medium.failure();
}

void readContents(const SystemRoot& root, const DeviceProperties& properties, DiskFacts& facts) {
  facts.busPath = properties.find("ID_PATH").value_or(carrierOf(facts.device));
  facts.partitionType = properties.find("ID_PART_ENTRY_TYPE");
  facts.partition = partitionFrom(properties, facts.device);
  if (properties.find("ID_FS_TYPE") || properties.find("ID_PART_TABLE_TYPE")) {
    facts.volume = volumeFrom(properties);
    facts.table.type = properties.find("ID_PART_TABLE_TYPE").value_or("");
  } else if (const auto isRead = readDisk(root, facts); !isRead && !facts.unread) {
    facts.unread = isRead.failure();
  }
}

}  // namespace

std::string withoutHexEscapes(std::string_view text) {
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

Result<std::optional<DiskFacts>> factsOf(const SystemRoot& root, const DiskName& name) {
  const BlockDevices devices(root);
  const auto found = devices.find(name);
  if (!found) return found.failure();
  const auto& device = *found;
  const bool hasNode = device && device->number.major != 0;  // the paths of a multipath device have none
  if (!hasNode || device->size == 0) return std::nullopt;
  const auto properties = DeviceProperties::of(root, device->number);
  if (!properties) return properties.failure();
  const auto isOptical = devices.isOptical(device->disk);
  if (!isOptical) return isOptical.failure();
  DiskFacts facts;
  facts.device = *device;
  if (*isOptical) readMedium(root, *properties, facts);
  if (*isOptical && facts.medium == OpticalMedium::none) return std::nullopt;
  readContents(root, *properties, facts);
  return facts;
}

}  // namespace tavisk
