// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchDiskManagement.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* section = "Firmware";
constexpr const char* preferenceKey = "Boot Preference";
constexpr const char* networkKey = "Network Preference";
constexpr ServiceStatus failed = 1;

using Value = Result<std::optional<std::string>>;

std::string textOf(const BootSettings::BootChoice& choice) {
  auto text = choice.disk.text;
  if (!choice.systemFolder.empty()) text += " " + choice.systemFolder;
  if (choice.lumara9) text += " (Lumara 9)";
  return text;
}

Value bootPreferenceText(MachineFile& machine) {
  const auto preference = machine.section(section).section(preferenceKey);
  const auto disk = preference.optionalText("Disk");
  if (!disk) return std::optional<std::string>();
  return std::optional(
      textOf({{*disk}, preference.optionalText("Folder").value_or(""), preference.boolean("Lumara 9")}));
}

void storeBootPreference(MachineFile::Dictionary& machine, const BootSettings::BootChoice& choice) {
  auto& preference = machine.dictionary(section).dictionary(preferenceKey);
  preference.set("Disk", choice.disk.text);
  preference.set("Folder", choice.systemFolder);
  preference.set("Lumara 9", choice.lumara9);
}

}  // namespace

bool ScratchDiskManagement::is(DiskTrait trait, const DiskName& disk) {
  const auto known = _disks.find(disk);
  if (!known) return false;
  switch (trait) {
    case DiskTrait::internal:
      return known->internal;
    case DiskTrait::cd:
      return known->cd;
    case DiskTrait::dvd:
      return known->dvd;
    case DiskTrait::optical:
      return known->optical;
  }
  return false;
}

std::string ScratchDiskManagement::protocolOf(const DiskName& disk) {
  const auto known = _disks.find(disk);
  return known ? known->protocol : "";
}

std::string ScratchDiskManagement::nameOf(DiskProtocol protocol) {
  return protocol == DiskProtocol::usb ? "USB" : "Disk Image";
}

int ScratchDiskManagement::partitionScheme(const DiskName& disk) {
  const auto known = _disks.find(disk);
  return known ? known->scheme : 0;
}

DiskQueries::OpticalBootability ScratchDiskManagement::opticalBootability(const DiskName& disk) {
  const auto known = _disks.find(disk);
  return known ? OpticalBootability{known->opticalStatus, known->opticalBootable} : OpticalBootability{failed, false};
}

int ScratchDiskManagement::preBootEnvironment() {
  return static_cast<int>(_machine.section(section).integer("Pre-Boot Environment"));
}

BootSettings::LegacyBootSupport ScratchDiskManagement::legacyBootSupport() {
  const auto firmware = _machine.section(section);
  return {static_cast<ServiceStatus>(firmware.integer("Legacy Boot Status")), firmware.boolean("Legacy Boot")};
}

BootSettings::BootPreference ScratchDiskManagement::bootPreference() {
  const auto known = _settings.read({setting::startupDisk, "", bootPreferenceText, nullptr});
  const auto disk = _machine.section(section).section(preferenceKey).optionalText("Disk");
  if (!known || !disk || !_machine.section("Disks").find(*disk)) return {failed, std::nullopt};
  return {0, DiskName{*disk}};
}

BootSettings::NetworkBootPreference ScratchDiskManagement::networkBootPreference() {
  const auto interface = [](MachineFile& machine) -> Value {
    return machine.section(section).section(networkKey).optionalText("Interface");
  };
  const auto known = _settings.read({setting::networkStartupDisk, "", interface, nullptr});
  const auto preference = _machine.section(section).section(networkKey);
  if (!known || preference.isAbsent()) return {failed, {}, {}, {}};
  return {0, preference.optionalText("Value"), preference.optionalText("Server"), known};
}

ServiceStatus ScratchDiskManagement::setBootPreference(const BootChoice& choice) {
  const auto store = [&](MachineFile::Dictionary& machine) { storeBootPreference(machine, choice); };
  return change(setting::startupDisk, textOf(choice), "Set Boot Preference Status", bootPreferenceText, store);
}

ServiceStatus ScratchDiskManagement::setFirmwareVariable(const std::string& name, const std::string& value) {
  const auto read = [&](MachineFile& machine) -> Value {
    return machine.section(section).section("Variables").optionalText(name);
  };
  const auto store = [&](MachineFile::Dictionary& machine) {
    machine.dictionary(section).dictionary("Variables").set(name, value);
  };
  return change(setting::firmwareVariable + name, value, "Set Variable Status", read, store);
}

ServiceStatus ScratchDiskManagement::change(const std::string& setting, const std::string& asked, const char* statusKey,
                                            const MachineSetting::Read& read, const MachineFile::Edit& store) {
  ServiceStatus status = failed;  // what a refusal leaves
  Setting<std::string> parts;
  parts.name = setting;
  parts.where = _machine.path();
  parts.live = parts.stored = [&] { return read(_machine); };
  parts.store = [&](const std::string&) -> Result<void> {
    const auto answer = static_cast<ServiceStatus>(_machine.section(section).integer(statusKey));
    if (answer != 0) {
      status = answer;
      return Failure{"set", "the rehearsed firmware", "status " + std::to_string(answer)};
    }
    auto written = _machine.change(store);
    if (written) status = 0;
    return written;
  };
  parts.always = true;
  _settings.carryOut(parts, asked);
  return status;
}

}  // namespace tavisk
