// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchDiskManagement.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* firmwareSection = "Firmware";
constexpr const char* preferenceKey = "Boot Preference";
constexpr const char* networkKey = "Network Preference";
constexpr const char* variablesKey = "Variables";
constexpr ServiceStatus failed = 1;

MachineSetting<BootSettings::BootChoice>::Found readBootPreference(MachineFile& machine) {
  const auto preference = machine.section(firmwareSection).section(preferenceKey);
  const auto disk = preference.optionalText("Disk");
  if (!disk) return std::nullopt;
  return BootSettings::BootChoice{
      {*disk}, preference.optionalText("Folder").value_or(""), preference.boolean("Lumara 9")};
}

void storeBootPreference(MachineFile::Dictionary& machine, const BootSettings::BootChoice& choice) {
  auto& preference = machine.dictionary(firmwareSection).dictionary(preferenceKey);
  preference.set("Disk", choice.disk.text);
  preference.set("Folder", choice.systemFolder);
  preference.set("Lumara 9", choice.lumara9);
}

MachineSetting<BootSettings::BootChoice> bootPreferenceSetting() {
  return {setting::startupDisk, "", readBootPreference, storeBootPreference};
}

MachineSetting<std::string> variableNamed(const std::string& name) {
  return {
      setting::firmwareVariable + name, "",
      [=](MachineFile& machine) { return machine.section(firmwareSection).section(variablesKey).optionalText(name); },
      [=](MachineFile::Dictionary& machine, const std::string& value) {
        machine.dictionary(firmwareSection).dictionary(variablesKey).set(name, value);
      }};
}

}  // namespace

std::string textOf(const BootSettings::BootChoice& choice) {
  auto text = choice.disk.text;
  if (!choice.systemFolder.empty()) text += " " + choice.systemFolder;
  if (choice.lumara9) text += " (Lumara 9)";
  return text;
}

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
  return static_cast<int>(_machine.section(firmwareSection).integer("Pre-Boot Environment"));
}

BootSettings::LegacyBootSupport ScratchDiskManagement::legacyBootSupport() {
  const auto firmware = _machine.section(firmwareSection);
  return {static_cast<ServiceStatus>(firmware.integer("Legacy Boot Status")), firmware.boolean("Legacy Boot")};
}

BootSettings::BootPreference ScratchDiskManagement::bootPreference() {
  const auto choice = _settings.read(bootPreferenceSetting());
  if (!choice || !_machine.section("Disks").find(choice->disk.text)) return {failed, std::nullopt};
  return {0, choice->disk};
}

BootSettings::NetworkBootPreference ScratchDiskManagement::networkBootPreference() {
  const auto readInterface = [](MachineFile& machine) {
    return machine.section(firmwareSection).section(networkKey).optionalText("Interface");
  };
  const auto interface =
      _settings.read(MachineSetting<std::string>{setting::networkStartupDisk, "", readInterface, nullptr});
  if (!interface) return {failed, {}, {}, {}};
  const auto preference = _machine.section(firmwareSection).section(networkKey);
  return {0, preference.optionalText("Value"), preference.optionalText("Server"), interface};
}

ServiceStatus ScratchDiskManagement::setBootPreference(const BootChoice& choice) {
  return change(bootPreferenceSetting(), choice, "Set Boot Preference Status");
}

/// Whatever a value is made of is in this machine's file, and was read.
ServiceStatus ScratchDiskManagement::setFirmwareVariable(const std::string& name, const Result<std::string>& value) {
  return value ? change(variableNamed(name), *value, "Set Variable Status") : failed;
}

template <typename Value>
ServiceStatus ScratchDiskManagement::change(const MachineSetting<Value>& setting, const Value& asked,
                                            const char* statusKey) {
  auto status = failed;  // what a refusal leaves
  auto parts = _settings.parts(setting);
  parts.check = [&](const Value&) -> Result<void> {
    const auto answer = static_cast<ServiceStatus>(_machine.section(firmwareSection).integer(statusKey));
    if (answer == 0) return {};
    status = answer;
    return Failure{"set", "the rehearsed firmware", "status " + std::to_string(answer)};
  };
  parts.store = [&, write = parts.store](const Value& value) {
    auto written = write(value);
    if (written) status = 0;
    return written;
  };
  const auto effect = _settings.carryOut(parts, asked);
  return effect.outcome == Outcome::failed ? status : 0;
}

}  // namespace tavisk
