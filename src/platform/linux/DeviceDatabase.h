// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>

#include "platform/SystemRoot.h"
#include "platform/linux/MountTable.h"

namespace tavisk {

/// What the device manager has found out about one device and keeps in /run/udev: its properties, by the names that
/// `udevadm info` shows. Nothing where no device manager runs.
class DeviceProperties {
 public:
  static DeviceProperties ofBlockDevice(const SystemRoot& root, DeviceNumber number);

  bool empty() const { return _values.empty(); }
  std::optional<std::string> find(const std::string& name) const;
  /// Of a property whose blanks and special characters are written as \x20.
  std::optional<std::string> findEncoded(const std::string& name) const;
  bool isSet(const std::string& name) const { return find(name) == "1"; }
  /// Whether one of those whose names begin so is.
  bool isAnySet(const std::string& beginning) const;

 private:
  std::map<std::string, std::string> _values;
};

}  // namespace tavisk
