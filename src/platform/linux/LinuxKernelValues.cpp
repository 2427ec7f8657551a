// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxKernelValues.h"

#include <algorithm>

#include "platform/Text.h"
#include "platform/linux/BlockDevices.h"
#include "platform/linux/KernelFile.h"
#include "platform/linux/MountTable.h"

namespace tavisk {
namespace {

constexpr std::size_t longestModel = 127;
constexpr std::size_t fileLimit = 65536;
/// What a firmware that started from an iSCSI disk leaves (iBFT).
constexpr const char* iscsiStart = "/sys/firmware/ibft";

}  // namespace

std::string LinuxKernelValues::model() {
  for (const char* file : {"/sys/class/dmi/id/product_name", "/sys/firmware/devicetree/base/model"}) {
    const auto name = readKernelFile(_root, file).valueOr("");
    if (!name.empty()) return name.substr(0, longestModel);
  }
  return "";
}

std::int32_t LinuxKernelValues::networkStart() {
  const auto words = split(_root.read("/proc/cmdline", fileLimit).valueOr(""), " \n");
  const bool isTold =
      std::any_of(words.begin(), words.end(), [](const auto& word) { return word.starts_with("BOOTIF="); });
  return isTold || _root.exists(iscsiStart) || isRootOnNetwork() ? 1 : 0;
}

bool LinuxKernelValues::isRootOnNetwork() const {
  const auto mounts = MountTable::read(_root);
  const auto* mount = mounts ? mounts->holding("/") : nullptr;
  if (mount == nullptr) return false;
  if (mount->type.starts_with("nfs")) return true;
  const BlockDevices devices(_root);
  const auto device = devices.withNumber(mount->device);
  const auto connection = device ? devices.transportOf(devices.wholeDisk(device->name)) : "";
  return connection == transport::iscsi || connection == transport::network;
}

}  // namespace tavisk
