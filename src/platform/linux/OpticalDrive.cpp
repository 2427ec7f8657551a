// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/OpticalDrive.h"

#include <fcntl.h>
#include <linux/cdrom.h>
#include <sys/ioctl.h>

#include <array>
#include <climits>

namespace tavisk {
namespace {

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

}  // namespace

OpticalMedium mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties) {
  if (properties.isAnySet("ID_CDROM_MEDIA_CD")) return OpticalMedium::cd;
  if (properties.isAnySet("ID_CDROM_MEDIA_DVD")) return OpticalMedium::dvd;
  if (properties.isSet("ID_CDROM_MEDIA")) return OpticalMedium::other;
  return properties.isSet("ID_CDROM") ? OpticalMedium::none : askDrive(root, node);
}

}  // namespace tavisk
