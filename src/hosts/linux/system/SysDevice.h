// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The file of a device that says whether it may wake the machine: "enabled" or "disabled".
inline constexpr const char* wakeSwitch = "power/wakeup";

/// A device as the kernel shows it beneath /sys/devices.
class SysDevice {
 public:
  /// Any path that leads to it, also through links. The root must outlive the object. Absent when nothing is there.
  static Result<std::optional<SysDevice>> at(const SystemRoot& root, const std::string& path);

  const std::string& path() const { return _path; }
  /// "pci", "pnp"; empty when it has none.
  Result<std::string> subsystem() const;
  /// What it hangs on; absent at the top of the tree.
  std::optional<SysDevice> parent() const;
  /// Whether it has `wakeSwitch`, as only devices have that can wake the machine.
  Result<bool> canWake() const;
  Result<bool> has(const std::string& name) const;
  /// isGone(): there is no such file, or no such device any more.
  Result<std::string> read(const std::string& name) const;
  /// Whether it has the attribute and that says this.
  Result<bool> says(const std::string& name, std::string_view text) const;
  /// The names in one of its folders; none when it has no such folder.
  Result<std::vector<std::string>> list(const std::string& folder) const;
  /// To write to what is gone is no failure.
  Result<void> write(const std::string& name, std::string_view value) const;

 private:
  SysDevice(const SystemRoot& root, std::string path) : _root(&root), _path(std::move(path)) {}

  const SystemRoot* _root;
  std::string _path;
};

}  // namespace tavisk
