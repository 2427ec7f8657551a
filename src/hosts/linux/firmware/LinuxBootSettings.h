// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/firmware/BootVolumes.h"
#include "hosts/linux/firmware/EfiVariables.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// What the machine starts from, kept by UEFI firmware. Other firmware has no choice of a disk that Linux could set: it
/// has no preference, and to set one is not supported. Nothing is set by what could not be looked at.
class LinuxBootSettings final : public BootSettings {
 public:
  /// The disks are not owned.
  LinuxBootSettings(const LinuxMachine& machine, LinuxDisks& disks);

  /// Where the order before the last change is kept, one line as firmware tools take it.
  static constexpr const char* previousOrder = "/var/lib/tavisk/previous-boot-order";

  int preBootEnvironment() override;
  LegacyBootSupport legacyBootSupport() override;
  BootPreference bootPreference() override;
  NetworkBootPreference networkBootPreference() override;
  ServiceStatus setBootPreference(const BootChoice& choice) override;
  ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) override;

 private:
  using Preferred = Result<std::optional<BootEntry>>;

  Preferred preferred() const;
  Result<std::optional<DiskName>> volumeOf(const Preferred& entry) const;
  Result<std::optional<NetworkBootPreference>> networkOf(const Preferred& entry) const;
  void tell(const char* name, const Setting<std::string>::Found& next, const Setting<std::string>::Read& lasting) const;
  Result<EfiLoadOption> optionFor(const BootChoice& choice) const;
  std::optional<Failure> whyRefused(const BootTarget& target) const;
  Result<int> environment() const;
  Result<std::string> interfaceWith(const std::string& hardwareAddress) const;
  std::string noteOnNextStart() const;
  Result<void> keepOrder(const std::vector<std::uint16_t>& order, WrittenPlaces& written) const;
  ServiceStatus change(Setting<std::string> parts, const std::string& asked, const MachineHold& held) const;

  LinuxMachine _machine;
  EfiVariables _variables;
  BootEntries _entries;
  BootVolumes _volumes;
  FailedLooks& _looks;
};

}  // namespace tavisk
