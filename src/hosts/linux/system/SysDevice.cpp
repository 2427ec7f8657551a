// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/SysDevice.h"

#include "base/Path.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr std::string_view top = "/sys/devices";

}  // namespace

Result<std::optional<SysDevice>> SysDevice::at(const SystemRoot& root, const std::string& path) {
  auto resolved = root.standardized(path);
  if (!resolved) return resolved.failure();
  const auto there = root.isThere(*resolved);
  if (!there) return there.failure();
  return *there ? std::optional(SysDevice(root, std::move(resolved).value())) : std::nullopt;
}

Result<std::string> SysDevice::subsystem() const {
  const auto link = orGone(_root->readLink(_path + "/subsystem"));
  if (!link) return link.failure();
  return *link ? baseName(**link) : std::string();
}

std::optional<SysDevice> SysDevice::parent() const {
  auto above = parentFolder(_path);
  if (!above.starts_with(top) || above.size() == top.size()) return std::nullopt;
  return SysDevice(*_root, std::move(above));
}

Result<bool> SysDevice::canWake() const {
  return has(wakeSwitch);
}

Result<bool> SysDevice::has(const std::string& name) const {
  return _root->isThere(_path + "/" + name);
}

Result<std::string> SysDevice::read(const std::string& name) const {
  return readKernelFile(*_root, _path + "/" + name);
}

Result<bool> SysDevice::says(const std::string& name, std::string_view text) const {
  const auto value = orGone(read(name));
  if (!value) return value.failure();
  return *value == text;
}

Result<std::vector<std::string>> SysDevice::list(const std::string& folder) const {
  const auto names = orGone(_root->list(_path + "/" + folder));
  if (!names) return names.failure();
  return names->value_or(std::vector<std::string>());
}

Result<void> SysDevice::write(const std::string& name, std::string_view value) const {
  const auto written = writeKernelFile(*_root, _path + "/" + name, value);
  return !written && isGone(written.failure()) ? Result<void>() : written;
}

}  // namespace tavisk
