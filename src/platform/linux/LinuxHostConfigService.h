// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "platform/HostConfigService.h"
#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/NameAnnouncer.h"

namespace tavisk {

/// The names in /etc/machine-info and /etc/hostname, through the service that keeps them (org.freedesktop.hostname1(5))
/// where it is there; the kernel's name, the one that is announced, and the machine's own line in /etc/hosts.
class LinuxHostConfigService final : public HostConfigService {
 public:
  explicit LinuxHostConfigService(const LinuxMachine& machine)
      : _machine(machine), _announcer(machine.services, machine.runLoop) {}

  void setComputerName(const std::string& name) override;
  void setLocalNetworkName(const std::string& name) override;

 private:
  using Value = std::optional<std::string>;

  /// The service's answer, or false where it is left to the files.
  Result<bool> setByService(const char* member, const std::string& name);
  Result<Value> serviceComputerName();
  Result<void> storeComputerName(const std::string& name);
  Result<Value> liveLocalName();
  Result<void> storeLocalName(const std::string& name);
  Result<void> storeStaticName(const std::string& name);
  Result<void> applyLocalName(const std::string& name);

  LinuxMachine _machine;
  NameAnnouncer _announcer;
};

}  // namespace tavisk
