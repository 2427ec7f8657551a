// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/firmware/BootEntries.h"
#include "hosts/linux/firmware/BootVolumes.h"
#include "hosts/linux/firmware/EfiVariables.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/systems/LinuxSystems.h"
#include "hosts/linux/systems/SystemChoice.h"
#include "hosts/shared/SettingChange.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// What the machine starts from, kept by UEFI firmware and by the loaders of Linux systems. Other firmware has no
/// choice of a disk that Linux could set, and no variables: there a loader's own default is the preference, and what
/// would be a variable is kept in a file. Nothing is set by what could not be looked at.
class LinuxBootSettings final : public BootSettings {
 public:
  /// Neither the disks nor the systems are owned.
  LinuxBootSettings(const LinuxMachine& machine, LinuxDisks& disks, const LinuxSystems& systems);

  /// Where the order before the last change is kept, one line as firmware tools take it.
  static constexpr const char* previousOrder = "/var/lib/tavisk/previous-boot-order";
  /// Where variables are kept, each in a file of its name, on a machine whose firmware has none.
  static constexpr const char* keptVariables = "/var/lib/tavisk/firmware-variables/";

  int preBootEnvironment() override;
  LegacyBootSupport legacyBootSupport() override;
  BootPreference bootPreference() override;
  NetworkBootPreference networkBootPreference() override;
  ServiceStatus setBootPreference(const BootChoice& choice) override;
  ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) override;

 private:
  using Preferred = Result<std::optional<BootEntry>>;
  using Started = Result<std::optional<StartedSystem>>;  ///< absent: from the network

  Preferred preferred(StartTime time) const;
  Started started(StartTime time) const;
  Started startedBy(const Preferred& entry, StartTime time) const;
  Result<std::optional<NetworkBootPreference>> networkOf(const Preferred& entry) const;
  Support startSupport() const;
  void tell(const char* name, const Setting<std::string>::Found& next, const Setting<std::string>::Read& lasting,
            const std::function<Support()>& supported) const;
  ServiceStatus setFile(const BootChoice& choice);
  ServiceStatus setSystem(const BootChoice& choice);
  Result<void> check(const WayToSystem& way) const;
  Result<void> start(const WayToSystem& way, WrittenPlaces& written) const;
  Result<void> setDefault(const WayToSystem& way, WrittenPlaces& written,
                          const std::function<Result<void>()>& goOn) const;
  Result<EfiLoadOption> optionFor(const LoaderPlace& place, const Volumes& volumes) const;
  Result<EfiLoadOption> optionFor(const BootChoice& choice) const;
  std::optional<Failure> whyRefused(const SystemRoot& root, const std::string& path) const;
  std::string noteOn(const WayToSystem& way) const;
  std::string noteOnNextStart() const;
  Result<void> keepOrder(const std::vector<std::uint16_t>& order, WrittenPlaces& written) const;
  ServiceStatus keepVariable(Setting<std::string> parts, const std::string& name, const std::string& value) const;
  ServiceStatus change(Setting<std::string> parts, const std::string& asked, const MachineHold& held) const;

  LinuxMachine _machine;
  EfiVariables _variables;
  BootEntries _entries;
  BootVolumes _volumes;
  const LinuxSystems& _systems;
  SystemChoice _choice;
  FailedLooks& _looks;
};

}  // namespace tavisk
