// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <functional>
#include <initializer_list>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Whether all of this is so, asked in order; what is not so, or cannot be looked at, ends it.
inline Result<bool> allHold(std::initializer_list<std::function<Result<bool>()>> questions) {
  for (const auto& question : questions)
    if (auto answer = question(); !answer || !*answer) return answer;
  return true;
}

/// What `look` finds of each device, without those of which there is nothing (Result<std::optional<...>>). The first
/// look that fails is the answer.
template <typename Devices, typename Look>
auto ofEach(const Devices& devices, Look look) {
  using Found = typename std::remove_cvref_t<decltype(*look(*std::begin(devices)))>::value_type;
  std::vector<Found> all;
  for (const auto& device : devices) {
    const auto found = look(device);
    if (!found) return Result<std::vector<Found>>(found.failure());
    if (*found) all.push_back(**found);
  }
  return Result<std::vector<Found>>(std::move(all));
}

/// The same of each name in a folder; a machine without the folder has none.
template <typename Look>
auto ofEachIn(const SystemRoot& root, const std::string& folder, Look look) {
  const auto names = orEmpty(root.list(folder));
  return names ? ofEach(*names, look) : decltype(ofEach(*names, look))(names.failure());
}

/// The same of devices that may be unknown.
template <typename Device, typename Look>
auto ofEach(const Result<std::vector<Device>>& devices, Look look) {
  return devices ? ofEach(*devices, look) : decltype(ofEach(*devices, look))(devices.failure());
}

/// A machine has the setting that one of its devices has; else `none` is why not.
template <typename Device>
Support supportBy(const Result<std::vector<Device>>& devices, Failure none) {
  if (!devices) return devices.failure();
  return devices->empty() ? std::optional(NotSupported{std::move(none)}) : std::nullopt;
}

/// A setting's value on one of the machine's devices, or in one of its files; absent where it has none.
template <typename Value>
struct DeviceValue {
  std::string device;
  std::optional<Value> value;
};

/// What a look at a device found: nothing on one that has gone away meanwhile.
template <typename Value>
Result<std::optional<DeviceValue<Value>>> on(const std::string& device, const Result<std::optional<Value>>& value) {
  if (!value) return value.failure();
  return *value ? std::optional(DeviceValue<Value>{device, *value}) : std::nullopt;
}

/// The value that all devices have; where they differ the greatest, with the detail of each of them, the greatest
/// first: "10 on sda, 0 on sdb". Absent when no device has a value.
template <typename Value>
Result<std::optional<Reading<Value>>> readingOfAll(Result<std::vector<DeviceValue<Value>>> found) {
  if (!found) return found.failure();
  auto values = std::move(found).value();
  std::ranges::stable_sort(values, std::ranges::greater(), &DeviceValue<Value>::value);
  if (values.empty() || !values.front().value) return std::nullopt;
  const auto greatest = *values.front().value;
  if (values.back().value == greatest) return greatest;
  std::string detail;
  for (const auto& [device, value] : values)
    detail += (detail.empty() ? "" : ", ") + (value ? textOf(*value) : "nothing") + " on " + device;
  return Reading<Value>(greatest, std::move(detail));
}

/// Does the same with each of the machine's devices, those after a failure too. The first failure is the answer.
template <typename Device, typename Set>
Result<void> setEach(const Result<std::vector<Device>>& devices, Set set) {
  if (!devices) return devices.failure();
  Result<void> all;
  for (const auto& device : *devices)
    if (auto done = set(device); !done && all) all = done;
  return all;
}

}  // namespace tavisk
