// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/LinuxDiskQueries.h"

namespace tavisk {
namespace {

constexpr ServiceStatus failed = 1;

constexpr int otherMap = 4;

int schemeOf(const std::string& table) {
  if (table.empty()) return partitionmap::noneKnown;
  if (table == "mac") return partitionmap::openFirmware;
  if (table == "gpt") return partitionmap::gpt;
  return table == "dos" ? LinuxDiskQueries::masterBootRecord : otherMap;
}

}  // namespace

bool LinuxDiskQueries::isOptical(const DiskName& whole) const {
  return _disks.looks().orTold(_disks.devices().isOptical(whole));
}

bool LinuxDiskQueries::is(DiskTrait trait, const DiskName& disk) {
  const auto whole = _disks.wholeDisk(disk);
  const auto medium = [&] {
    const auto facts = _disks.facts(whole);
    return facts ? facts->medium : OpticalMedium::none;
  };
  switch (trait) {
    case DiskTrait::internal:
      return _disks.looks().orTold(_disks.devices().isInternal(whole));
    case DiskTrait::cd:
      return medium() == OpticalMedium::cd;
    case DiskTrait::dvd:
      return medium() == OpticalMedium::dvd;
    case DiskTrait::optical:
      return isOptical(whole);
  }
  return false;
}

std::string LinuxDiskQueries::protocolOf(const DiskName& disk) {
  return _disks.looks().orTold(_disks.devices().transportOf(_disks.wholeDisk(disk)));
}

std::string LinuxDiskQueries::nameOf(DiskProtocol protocol) {
  return protocol == DiskProtocol::usb ? transport::usb : transport::diskImage;
}

int LinuxDiskQueries::partitionScheme(const DiskName& disk) {
  const auto facts = _disks.facts(_disks.wholeDisk(disk));
  return facts ? schemeOf(facts->table.type) : partitionmap::noneKnown;
}

DiskQueries::OpticalBootability LinuxDiskQueries::opticalBootability(const DiskName& disk) {
  const auto whole = _disks.wholeDisk(disk);
  const auto facts = _disks.facts(whole);
  if (!facts || facts->unread || !isOptical(whole)) return {failed, false};
  return {0, facts->volume.bootSystemId == "EL TORITO SPECIFICATION"};
}

}  // namespace tavisk
