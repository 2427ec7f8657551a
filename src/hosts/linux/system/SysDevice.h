// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A device as the kernel shows it beneath /sys/devices.
class SysDevice {
 public:
  /// Any path that leads to it, also through links. The root must outlive the object. Absent when nothing is there.
  static std::optional<SysDevice> at(const SystemRoot& root, const std::string& path);

  const std::string& path() const { return _path; }
  /// "pci", "pnp"; empty when it has none.
  std::string subsystem() const;
  /// What it hangs on; absent at the top of the tree.
  std::optional<SysDevice> parent() const;
  /// Whether it can wake the machine: only such a device has the file power/wakeup.
  bool canWake() const;
  bool has(const std::string& name) const;
  Result<std::string> read(const std::string& name) const;
  Result<void> write(const std::string& name, const std::string& value) const;

 private:
  SysDevice(const SystemRoot& root, std::string path) : _root(&root), _path(std::move(path)) {}

  const SystemRoot* _root;
  std::string _path;
};

}  // namespace tavisk
