// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/SysDevice.h"

#include "base/Path.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::string_view top = "/sys/devices";

}  // namespace

std::optional<SysDevice> SysDevice::at(const SystemRoot& root, const std::string& path) {
  auto resolved = root.standardized(path);
  if (!resolved || !root.exists(*resolved)) return std::nullopt;
  return SysDevice(root, std::move(resolved).value());
}

std::string SysDevice::subsystem() const {
  return baseName(_root->readLink(_path + "/subsystem").valueOr(""));
}

std::optional<SysDevice> SysDevice::parent() const {
  auto above = parentFolder(_path);
  if (!above.starts_with(top) || above.size() == top.size()) return std::nullopt;
  return SysDevice(*_root, std::move(above));
}

bool SysDevice::canWake() const {
  return has(wakeSwitch);
}

bool SysDevice::has(const std::string& name) const {
  return _root->exists(_path + "/" + name);
}

Result<std::string> SysDevice::read(const std::string& name) const {
  return readKernelFile(*_root, _path + "/" + name);
}

Result<void> SysDevice::write(const std::string& name, std::string_view value) const {
  return writeKernelFile(*_root, _path + "/" + name, value);
}

}  // namespace tavisk
