// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/UdevRule.h"

#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* valueLine = "# value: ";
constexpr const char* managerSocket = "/run/udev/control";

}  // namespace

UdevRule::UdevRule(const SystemRoot& root, const std::string& setting)
    : _root(root), _file(ownfile::udevRule(setting)) {}

std::optional<std::string> UdevRule::value() const {
  constexpr std::size_t limit = 65536;
  const auto text = _root.read(_file, limit).valueOr("");
  const auto line = text.find(valueLine);
  if (line == std::string::npos) return std::nullopt;
  const auto start = line + std::string_view(valueLine).size();
  return text.substr(start, text.find('\n', start) - start);
}

Result<void> UdevRule::write(const std::string& value, const std::string& rule) const {
  if (auto failure = whyNeedsRoot("write", _file)) return *failure;
  return _root.write(_file, std::string(ownfile::header) + valueLine + value + "\n" + rule + "\n");
}

std::string UdevRule::note() const {
  return _root.exists(managerSocket) ? "" : "no device manager runs here: lasts until the restart";
}

}  // namespace tavisk
