// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/LinuxIORegistry.h"

#include <utility>

#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::string_view deviceTree = "IODeviceTree:";
constexpr std::string_view servicePlane = "IOService:";
constexpr const char* firmwareTree = "/sys/firmware/devicetree/base";
constexpr const char* allDevices = "/sys/devices";
constexpr std::string_view sysfs = "/sys";
constexpr std::size_t longestProperty = 4096;

}  // namespace

std::optional<RegistryEntry> LinuxIORegistry::entryAtPath(const std::string& path) {
  if (!path.starts_with(deviceTree)) return std::nullopt;
  auto folder = _looks.orTold(orEmpty(_root.standardized(firmwareTree + path.substr(deviceTree.size()))));
  if (folder.empty() || !_looks.orTold(_root.isThere(folder))) return std::nullopt;
  return RegistryEntry{std::move(folder)};
}

std::optional<IORegistry::Data> LinuxIORegistry::dataProperty(const RegistryEntry& entry, const std::string& property) {
  if (property.find('/') != std::string::npos) return std::nullopt;
  const auto value = _looks.orTold(orGone(_root.read(entry.name + "/" + property, longestProperty)));
  return value ? std::optional(Data(value->begin(), value->end())) : std::nullopt;
}

bool LinuxIORegistry::isDevice(const std::string& folder) {
  return _looks.orTold(_root.isThere(folder + "/subsystem"));
}

std::optional<RegistryEntry> LinuxIORegistry::serviceNamed(const std::string& bsdName) {
  if (bsdName.empty() || bsdName.find('/') != std::string::npos) return std::nullopt;
  for (const auto* kind : {"/sys/class/net/", "/sys/class/block/"}) {
    auto folder = _looks.orTold(orEmpty(_root.standardized(kind + bsdName)));
    if (!folder.empty() && isDevice(folder)) return RegistryEntry{std::move(folder)};
  }
  return std::nullopt;
}

std::pair<RegistryStatus, RegistryEntry> LinuxIORegistry::parent(const RegistryEntry& entry, RegistryPlane /*plane*/) {
  auto above = entry.name;
  do above.resize(std::min(above.rfind('/'), above.size()));
  while (above.size() > std::string_view(allDevices).size() && !isDevice(above));
  return {0, {above.starts_with(allDevices) ? above : allDevices}};
}

std::pair<RegistryStatus, std::string> LinuxIORegistry::path(const RegistryEntry& entry, RegistryPlane plane) {
  const auto inTree = entry.name.substr(entry.name.starts_with(sysfs) ? sysfs.size() : 0);
  return {0, std::string(plane == RegistryPlane::deviceTree ? deviceTree : servicePlane) + inTree};
}

}  // namespace tavisk
