// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "hosts/linux/names/NameAnnouncer.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/WrittenPlaces.h"
#include "platform/NameServices.h"

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
  Result<void> checkComputerName(const std::string& name);
  Result<void> checkFile(const char* tried, const char* file);
  Result<void> storeComputerName(const std::string& name);
  Setting<std::string>::Found liveLocalName(const std::string& asked);
  Setting<std::string>::Found storedLocalName();
  struct Renamed {
    bool isStored;  ///< the machine's own file has the name already
    std::string before, after;
  };
  Result<Renamed> hostsRenamed(const std::string& name) const;
  Result<void> checkLocalName(const std::string& name);
  Result<void> storeLocalName(const std::string& name, WrittenPlaces& written);
  Failure putBackHosts(const std::string& hosts, const std::string& name, Failure cause, WrittenPlaces& written);
  bool isStoredAfterAll(const std::string& name, const Failure& cause) const;
  std::optional<Failure> whyAnnouncingNeedsRoot(const std::string& name);
  Result<void> storeStaticName(const std::string& name);
  Result<void> applyLocalName(const std::string& name);

  LinuxMachine _machine;
  NameAnnouncer _announcer;
};

/// The names as the machine has them at the moment: the one for people, which is that of its file, and the one that is
/// announced, else the first label of the kernel's. Opening a session never fails.
class LinuxDynamicStore final : public DynamicStore {
 public:
  explicit LinuxDynamicStore(const LinuxMachine& machine) : _machine(machine) {}

  std::unique_ptr<Session> open(const std::string& clientName) override;

 private:
  LinuxMachine _machine;
};

}  // namespace tavisk
