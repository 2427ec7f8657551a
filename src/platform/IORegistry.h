// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace tavisk {

/// 0 is success; printed in hexadecimal.
using RegistryStatus = std::uint32_t;
enum class RegistryPlane { service, deviceTree };

/// One object of the registry. It is only a name for it: the object may have gone meanwhile.
struct RegistryEntry {
  std::string name;
};

/// The device registry: what the machine's devices are, and how they hang together.
class IORegistry {
 public:
  virtual ~IORegistry() = default;

  using Data = std::vector<std::uint8_t>;

  virtual RegistryStatus masterPort() = 0;
  /// The path begins with its plane: "IODeviceTree:/". Absent when there is no such entry.
  virtual std::optional<RegistryEntry> entryAtPath(const std::string& path) = 0;
  /// Absent when the entry has no such property.
  virtual std::optional<Data> dataProperty(const RegistryEntry& entry, const std::string& property) = 0;
  /// The service of a network interface or disk, by its BSD name.
  virtual std::optional<RegistryEntry> serviceNamed(const std::string& bsdName) = 0;
  virtual std::pair<RegistryStatus, RegistryEntry> parent(const RegistryEntry& entry, RegistryPlane plane) = 0;
  /// The path begins with the plane's name and a colon.
  virtual std::pair<RegistryStatus, std::string> path(const RegistryEntry& entry, RegistryPlane plane) = 0;
};

}  // namespace tavisk
