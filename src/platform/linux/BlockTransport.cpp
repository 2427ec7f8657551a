// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>

#include "platform/linux/BlockDevices.h"

namespace tavisk {
namespace {

struct Sign {
  const char* text;
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

template <std::size_t Count>
const char* byNumberedName(const std::array<Sign, Count>& signs, const std::string& name) {
  for (const auto& sign : signs)
    if (isNumbered(name, sign.text)) return sign.transport;
  return nullptr;
}

const char* bySubsystem(const std::string& name) {
  const auto* const sign =
      std::find_if(subsystems.begin(), subsystems.end(), [&](auto& each) { return name == each.text; });
  return sign == subsystems.end() ? nullptr : sign->transport;
}

std::string baseName(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

bool isRemote(const std::string& transport) {
  return transport == transport::iscsi || transport == transport::network || transport == transport::diskImage;
}

}  // namespace

/// The folders of the device tree above a disk, the nearest first.
std::vector<std::string> BlockDevices::carriersOf(const DiskName& disk) const {
  constexpr std::string_view top = "/devices";
  std::vector<std::string> carriers;
  auto path = pathOf(disk).value_or("");
  while (path.size() > top.size()) {
    path.resize(path.rfind('/'));
    if (path.size() > top.size()) carriers.push_back(path);
  }
  return carriers;
}

std::string BlockDevices::transportOf(const DiskName& disk) const {
  const auto path = pathOf(disk);
  if (!path) return "";
  if (const auto* const found = byNumberedName(namesOfDevices, disk.text)) return found;
  const char* carried = nullptr;
  for (const auto& carrier : carriersOf(disk)) {
    if (const auto* const found = byNumberedName(namesOfCarriers, baseName(carrier))) return found;
    const auto subsystem = subsystemOf(carrier);
    if (subsystem == "usb") return transport::usb;
    if (subsystem == "nvme-fabrics") return transport::network;
    // The nearest one counts, unless something further up tells more.
    if (carried == nullptr) carried = bySubsystem(subsystem);
  }
  return carried == nullptr ? "" : carried;
}

bool BlockDevices::isInternal(const DiskName& disk) const {
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

}  // namespace tavisk
