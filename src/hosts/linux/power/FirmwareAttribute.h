// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A setting of the machine's firmware that the kernel offers as files
/// (Documentation/ABI/testing/sysfs-class-firmware-attributes), with its words for on and off.
struct FirmwareAttribute {
  std::string folder;
  std::string on;
  std::string off;

  /// Any other value than `off` counts as on.
  Result<bool> isOn(const SystemRoot& root) const;
  Result<void> set(const SystemRoot& root, bool turnOn) const;
};

/// The administrator's own rows come before the known ones, a line each: "NAME = ON WORD ; OFF WORD".
inline constexpr const char* firmwareAttributesFile = "/etc/tavisk/firmware-attributes.conf";

/// What makes this machine restart after a power failure; absent when its firmware offers nothing that is known.
Result<std::optional<FirmwareAttribute>> restartAttribute(const SystemRoot& root);

}  // namespace tavisk
