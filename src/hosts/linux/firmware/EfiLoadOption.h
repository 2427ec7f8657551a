// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "hosts/linux/firmware/EfiDevicePath.h"

namespace tavisk {

/// What a variable "Boot0000" holds (UEFI 2.10, section 3.1.3).
struct EfiLoadOption {
  std::uint32_t attributes = active;
  std::string description;  ///< what the firmware's menu shows
  std::string paths;        ///< the list of device paths as it is stored; the first one is what is started
  std::string data;         ///< what the started program is handed

  static constexpr std::uint32_t active = 1;  ///< without it firmware passes the entry over
  static constexpr std::uint32_t categories =
      0x1F00;  ///< 0 is a system to start; others, such as set-up, wait for a key
  bool isStartedUnasked() const { return (attributes & (active | categories)) == active; }
  /// Whether firmware does the same with both: the description is for people.
  bool startsAs(const EfiLoadOption& other) const;
};

/// Absent when the bytes are none.
std::optional<EfiLoadOption> parseLoadOption(std::string_view bytes);
std::string bytesOf(const EfiLoadOption& option);

/// What is started, in words: its device path, and whether something is handed to it.
std::string targetText(const EfiLoadOption& option);

}  // namespace tavisk
