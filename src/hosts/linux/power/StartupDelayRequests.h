// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "hosts/linux/system/ManagementController.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// By which requests the controllers of one maker take the delay between the return of power and the start. No standard
/// has it.
struct StartupDelayRequests {
  std::uint32_t manufacturer;
  std::uint8_t function;
  std::uint8_t set;
  std::optional<std::uint8_t> get;  ///< absent: they do not tell
  std::size_t width;                ///< bytes of the number, 1 to 4
  bool highByteFirst;
  std::uint32_t secondsEach;

  /// Absent when the controller cannot have exactly this delay.
  std::optional<ControllerRequest> setting(std::uint32_t seconds) const;
  /// In seconds; absent when the answer is too short.
  std::optional<std::uint64_t> delayIn(const std::vector<std::uint8_t>& answer) const;

  /// By how many bits the byte at this place is shifted in the number.
  std::size_t shiftOf(std::size_t place) const;
};

/// The administrator's own rows, before the known ones:
/// "manufacturer=343 netfn=0x30 set=0x54 get=0x55 width=2 order=big unit=1"; without "get" when there is none.
inline constexpr const char* startupDelayFile = "/etc/tavisk/startup-delay.conf";

/// Fails with the code ENOSYS when no row is for this maker, without a code at a line of that file that is not
/// understood.
Result<StartupDelayRequests> startupDelayRequests(const SystemRoot& root, std::uint32_t manufacturer);

}  // namespace tavisk
