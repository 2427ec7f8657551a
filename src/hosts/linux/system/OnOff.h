// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"

namespace tavisk {

/// The texts of a setting that is on or off.
inline const char* onOff(bool on) {
  return on ? "on" : "off";
}

inline Result<std::optional<std::string>> asOnOff(const Result<bool>& on) {
  if (!on) return on.failure();
  return std::optional<std::string>(onOff(*on));
}

}  // namespace tavisk
