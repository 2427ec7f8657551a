// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/DiskCopy.h"

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "base/Text.h"
#include "base/XmlText.h"

namespace tavisk {
namespace {

using Section = PropertyList::Dictionary;

constexpr auto longestFirstReport = std::chrono::milliseconds(200);
constexpr const char* treeRoot = "/";
constexpr std::string_view treePlane = "IODeviceTree:";
constexpr const char* compatible = "compatible";
constexpr int generationsToCarrier = 2;

std::vector<DiskName> disksOf(DiskEventSession& session, RunLoop& runLoop) {
  std::vector<DiskName> disks;
  const auto note = [](const DiskEvent& event, void* noted) {
    static_cast<std::vector<DiskName>*>(noted)->push_back(event.disk);
  };
  session.schedule(runLoop);
  session.registerCallback({note, &disks, DiskEvent::Kind::appeared, {}, {}});
  static_cast<void>(runLoop.runUntil(RunLoop::Clock::now() + longestFirstReport, [&] { return !disks.empty(); }));
  session.unregisterCallback(note, &disks);
  session.unschedule();
  return disks;
}

bool isWritable(const std::string& text) {
  return !offsetOfNonXml(text);
}

void setWhereKnown(Section& section, const char* key, const std::optional<std::string>& text) {
  if (text) section.set(key, isWritable(*text) ? *text : escaped(*text));
}

void describe(const DiskDescription& disk, Section& copied) {
  setWhereKnown(copied, "Volume Name", disk.volumeName);
  setWhereKnown(copied, "Mount Point", disk.volumePath);
  setWhereKnown(copied, "Kind", disk.volumeKind);
  setWhereKnown(copied, "UUID", disk.volumeUuid);
  setWhereKnown(copied, "Content", disk.mediaContent);
  setWhereKnown(copied, "Device Path", disk.devicePath);
  setWhereKnown(copied, "Bus Path", disk.busPath);
  copied.set("Size", disk.mediaSize);
  copied.set("Writable", disk.mediaWritable);
  copied.set("Mountable", disk.volumeMountable);
  copied.set("Network", disk.volumeNetwork);
}

/// By the name that it has in the copy.
std::string protocolOf(DiskManagementService& machine, const DiskName& disk) {
  const auto protocol = machine.protocolOf(disk);
  if (protocol == machine.nameOf(DiskProtocol::usb)) return "USB";
  return protocol == machine.nameOf(DiskProtocol::diskImage) ? "Disk Image" : protocol;
}

void describe(DiskManagementService& machine, const DiskName& disk, Section& copied) {
  for (const auto& [trait, key] : {std::pair(DiskTrait::internal, "Internal"),
                                   {DiskTrait::cd, "CD"},
                                   {DiskTrait::dvd, "DVD"},
                                   {DiskTrait::optical, "Optical"}})
    copied.set(key, machine.is(trait, disk));
  copied.set("Protocol", protocolOf(machine, disk));
  copied.set("Scheme", std::int64_t{machine.partitionScheme(disk)});
  if (!machine.is(DiskTrait::optical, disk)) return;
  const auto answer = machine.opticalBootability(disk);
  copied.set("Optical Bootable", answer.bootable);
  copied.set("Optical Status", std::int64_t{answer.status});
}

void copyFirmware(BootSettings& machine, Section& firmware) {
  firmware.set("Pre-Boot Environment", std::int64_t{machine.preBootEnvironment()});
  const auto legacy = machine.legacyBootSupport();
  firmware.set("Legacy Boot", legacy.supported);
  firmware.set("Legacy Boot Status", std::int64_t{legacy.status});
  if (const auto preference = machine.bootPreference(); preference.status == 0 && preference.disk)
    firmware.dictionary("Boot Preference").set("Disk", preference.disk->text);
  const auto network = machine.networkBootPreference();
  if (network.status != 0 || !network.interface) return;
  auto& copied = firmware.dictionary("Network Preference");
  setWhereKnown(copied, "Value", network.value);
  setWhereKnown(copied, "Server", network.server);
  setWhereKnown(copied, "Interface", network.interface);
}

void copyDeviceTree(IORegistry& machine, Section& registry) {
  const auto root = machine.entryAtPath(std::string(treePlane) + treeRoot);
  if (!root) return;
  auto& copied = registry.dictionary("Device Tree").dictionary(treeRoot);
  if (auto data = machine.dataProperty(*root, compatible)) copied.set(compatible, std::move(*data));
}

/// The path of the device that carries it, or what keeps that from being known.
void copyPath(IORegistry& machine, RegistryEntry entry, Section& copied) {
  for (int generation = 0; generation < generationsToCarrier; ++generation) {
    auto [status, parent] = machine.parent(entry, RegistryPlane::service);
    if (status != 0) {
      copied.set("Parent Status", std::int64_t{status});
      return;
    }
    entry = std::move(parent);
  }
  const auto [status, path] = machine.path(entry, RegistryPlane::deviceTree);
  if (status != 0)
    copied.set("Path Status", std::int64_t{status});
  else
    copied.set("Path", path.substr(std::min(path.size(), treePlane.size())));
}

/// One with several addresses counts by that of IPv4.
void copyInterfaces(Host& machine, Section& registry) {
  const auto addresses = machine.networkInterfaces().addresses();
  if (!addresses) return;
  for (const auto& address : *addresses) {
    const auto service = machine.registry().serviceNamed(address.interface);
    auto& interfaces = registry.dictionary("Interfaces");
    if (!service || (!address.ipv4 && interfaces.find(address.interface))) continue;
    auto& copied = interfaces.dictionary(address.interface);
    copied.set("Up", address.up);
    copied.set("Loopback", address.loopback);
    copied.set("IPv4", address.ipv4);
    copyPath(machine.registry(), *service, copied);
  }
}

}  // namespace

void copyDisks(Host& machine, RunLoop& runLoop, Section& copy, EffectSink& audience) {
  auto& session = machine.diskEvents();
  auto& disks = copy.dictionary("Disks");
  for (const auto& name : disksOf(session, runLoop)) {
    const auto description = session.description(name);
    if (!description) continue;
    if (!isWritable(name.text) || !isWritable(description->volumePath.value_or(""))) {
      audience.recordFailure("Disks", {"copy", name.text, "no property list can hold where it is mounted"});
      continue;
    }
    auto& copied = disks.dictionary(name.text);
    describe(*description, copied);
    describe(machine.diskManagement(), name, copied);
    copied.set("Whole Disk", session.wholeDisk(name).text);
  }
  copyFirmware(machine.diskManagement(), copy.dictionary("Firmware"));
  auto& registry = copy.dictionary("Registry");
  copyDeviceTree(machine.registry(), registry);
  copyInterfaces(machine, registry);
}

}  // namespace tavisk
