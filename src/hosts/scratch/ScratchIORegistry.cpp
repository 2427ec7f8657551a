// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchIORegistry.h"

namespace tavisk {
namespace {

constexpr const char* registrySection = "Registry";
constexpr std::string_view deviceTree = "IODeviceTree:";
constexpr RegistryStatus noSuchEntry = 2;

}  // namespace

RegistryStatus ScratchIORegistry::masterPort() {
  return static_cast<RegistryStatus>(_machine.section(registrySection).integer("Master Port Status"));
}

std::optional<RegistryEntry> ScratchIORegistry::entryAtPath(const std::string& path) {
  if (!path.starts_with(deviceTree)) return std::nullopt;
  const auto inTree = path.substr(deviceTree.size());
  if (!_machine.section(registrySection).section("Device Tree").find(inTree)) return std::nullopt;
  return RegistryEntry{inTree};
}

std::optional<IORegistry::Data> ScratchIORegistry::dataProperty(const RegistryEntry& entry,
                                                                const std::string& property) {
  const auto properties = _machine.section(registrySection).section("Device Tree").section(entry.name);
  const auto* value = properties.find(property);
  return value ? std::optional(*value->asData()) : std::nullopt;
}

std::optional<RegistryEntry> ScratchIORegistry::serviceNamed(const std::string& bsdName) {
  const RegistryEntry entry{bsdName};
  return interface(entry).isAbsent() ? std::nullopt : std::optional(entry);
}

/// All that carries an interface goes by the interface's name.
std::pair<RegistryStatus, RegistryEntry> ScratchIORegistry::parent(const RegistryEntry& entry, RegistryPlane) {
  return {static_cast<RegistryStatus>(interface(entry).integer("Parent Status")), entry};
}

std::pair<RegistryStatus, std::string> ScratchIORegistry::path(const RegistryEntry& entry, RegistryPlane) {
  const auto status = static_cast<RegistryStatus>(interface(entry).integer("Path Status"));
  const auto inTree = interface(entry).optionalText("Path");
  if (status != 0 || !inTree) return {status == 0 ? noSuchEntry : status, ""};
  return {0, std::string(deviceTree) + *inTree};
}

MachineSection ScratchIORegistry::interface(const RegistryEntry& entry) {
  return _machine.section(registrySection).section("Interfaces").section(entry.name);
}

}  // namespace tavisk
