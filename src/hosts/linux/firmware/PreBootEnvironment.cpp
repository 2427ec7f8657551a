// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/PreBootEnvironment.h"

#include <algorithm>

#include "platform/DiskManagementService.h"

namespace tavisk {
namespace {

constexpr const char* uefi = "/sys/firmware/efi";
constexpr const char* deviceTree = "/sys/firmware/devicetree/base";

Result<bool> isOpenFirmware(const SystemRoot& root) {
  const auto properties = orEmpty(root.list(deviceTree));
  if (!properties) return properties.failure();
  return std::ranges::any_of(*properties,
                             [](const auto& name) { return name == "openprom" || name.starts_with("ibm,"); });
}

}  // namespace

Result<int> preBootEnvironmentOf(const SystemRoot& root) {
  const auto isUefi = root.isThere(uefi);
  if (!isUefi) return isUefi.failure();
  if (*isUefi) return preboot::loadsBootEfi;
  const auto isOpen = isOpenFirmware(root);
  if (!isOpen) return isOpen.failure();
  return *isOpen ? preboot::openFirmware : preboot::noneKnown;
}

}  // namespace tavisk
