// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/InterfaceAddress.h"

#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* interfaces = "/sys/class/net";

}  // namespace

Result<std::string> interfaceWith(const std::string& hardwareAddress, const SystemRoot& root) {
  const auto names = orEmpty(root.list(interfaces));
  if (!names) return names.failure();
  for (const auto& name : *names) {
    const auto file = std::string(interfaces).append("/").append(name) + "/address";
    const auto address = orGone(readKernelFile(root, file));
    if (!address) return address.failure();
    if (*address && lowerCased(**address) == hardwareAddress) return name;
  }
  return Failure{"look for", interfaces, "none here has the address " + hardwareAddress};
}

}  // namespace tavisk
