// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

#include "hosts/linux/system/OnOff.h"

namespace tavisk {

/// Whether a value of an on/off setting says that it is on, at least in part.
inline bool isOn(const std::string& value) {
  return value.starts_with("on");
}

/// Whole minutes, what is begun counted as one: only nothing at all is 0, which means never.
std::string wholeMinutes(std::chrono::microseconds time);

/// A setting's value on one of the machine's devices.
struct DeviceValue {
  std::string device;
  std::string value;
};

/// The value that all devices have; where they differ, each of them, what is on or longest first: "10 on sda, 0 on
/// sdb". Empty when there are none.
std::string valueOfAll(std::vector<DeviceValue> values);

}  // namespace tavisk
