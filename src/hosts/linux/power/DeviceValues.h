// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// A setting's value on one of the machine's devices, or in one of its files; absent where it has none.
template <typename Value>
struct DeviceValue {
  std::string device;
  std::optional<Value> value;
};

/// The value that all devices have; where they differ the greatest, with the detail of each of them, the greatest
/// first: "10 on sda, 0 on sdb". Absent when no device has a value.
template <typename Value>
std::optional<Reading<Value>> readingOfAll(std::vector<DeviceValue<Value>> values) {
  std::ranges::stable_sort(values, std::ranges::greater(), &DeviceValue<Value>::value);
  if (values.empty() || !values.front().value) return std::nullopt;
  const auto greatest = *values.front().value;
  if (values.back().value == greatest) return greatest;
  std::string detail;
  for (const auto& [device, value] : values)
    detail += (detail.empty() ? "" : ", ") + (value ? textOf(*value) : "") + " on " + device;
  return Reading<Value>(greatest, std::move(detail));
}

/// Does the same with each of the machine's devices, those after a failure too. The first failure is the answer.
template <typename Devices, typename Set>
Result<void> setEach(const Devices& devices, Set set) {
  Result<void> all;
  for (const auto& device : devices)
    if (auto done = set(device); !done && all) all = done;
  return all;
}

}  // namespace tavisk
