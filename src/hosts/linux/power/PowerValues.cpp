// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/PowerValues.h"

#include <algorithm>

#include "base/Text.h"

namespace tavisk {

std::string wholeMinutes(std::chrono::microseconds time) {
  return std::to_string(std::chrono::ceil<std::chrono::minutes>(time).count());
}

std::string valueOfAll(std::vector<DeviceValue> values) {
  if (values.empty()) return {};
  std::ranges::stable_sort(values, [](const DeviceValue& one, const DeviceValue& other) {
    return std::pair(leadingInteger(one.value), one.value) > std::pair(leadingInteger(other.value), other.value);
  });
  if (values.front().value == values.back().value) return values.front().value;
  std::string all;
  for (const auto& each : values) all += (all.empty() ? "" : ", ") + each.value + " on " + each.device;
  return all;
}

}  // namespace tavisk
