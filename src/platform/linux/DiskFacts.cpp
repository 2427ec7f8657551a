// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/DiskFacts.h"

#include "platform/linux/DeviceDatabase.h"

namespace tavisk {
namespace {

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
