// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/DiskEventSession.h"
#include "platform/DiskManagementService.h"
#include "platform/IORegistry.h"
#include "platform/KernelValues.h"
#include "platform/KeyboardInputService.h"
#include "platform/NetworkInterfaces.h"
#include "platform/ProcessTermination.h"
#include "platform/ProgramRunner.h"
#include "platform/UserDefaults.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// In the place of what the startup disk asks of a Linux machine, until that is built: no disk is known, and every
/// question and change that an administrator counts on is a recorded failure.
class UnbuiltStartupDisk final : public DiskEventSession,
                                 public DiskManagementService,
                                 public IORegistry,
                                 public KernelValues,
                                 public KeyboardInputService,
                                 public NetworkInterfaces,
                                 public ProcessTermination,
                                 public ProgramRunner,
                                 public UserDefaults {
 public:
  explicit UnbuiltStartupDisk(const LinuxMachine& machine) : _effects(machine.effects) {}

  void schedule(RunLoop& runLoop) override;
  void unschedule() override {}
  void registerCallback(DiskCallbackRequest) override {}
  void unregisterCallback(DiskCallback, void*) override {}
  std::shared_ptr<const DiskDescription> description(const DiskName&) override { return nullptr; }
  std::optional<DiskName> diskOfPath(const std::string&) override { return std::nullopt; }
  DiskName wholeDisk(const DiskName& disk) override { return disk; }

  bool is(DiskTrait, const DiskName&) override { return false; }
  std::string protocolOf(const DiskName&) override { return {}; }
  std::string nameOf(DiskProtocol protocol) override { return protocol == DiskProtocol::usb ? "USB" : "loop"; }
  int partitionScheme(const DiskName&) override { return 0; }
  OpticalBootability opticalBootability(const DiskName&) override { return {notBuilt, false}; }
  int preBootEnvironment() override { return 0; }
  LegacyBootSupport legacyBootSupport() override { return {notBuilt, false}; }
  BootPreference bootPreference() override;
  NetworkBootPreference networkBootPreference() override { return {notBuilt, {}, {}, {}}; }
  ServiceStatus setBootPreference(const BootChoice& choice) override;
  ServiceStatus setFirmwareVariable(const std::string& name, const std::string& value) override;

  RegistryStatus masterPort() override { return 0; }
  std::optional<RegistryEntry> entryAtPath(const std::string&) override { return std::nullopt; }
  std::optional<Data> dataProperty(const RegistryEntry&, const std::string&) override { return std::nullopt; }
  std::optional<RegistryEntry> serviceNamed(const std::string&) override { return std::nullopt; }
  std::pair<RegistryStatus, RegistryEntry> parent(const RegistryEntry&, RegistryPlane) override;
  std::pair<RegistryStatus, std::string> path(const RegistryEntry&, RegistryPlane) override;

  std::string model() override { return {}; }
  std::int32_t epoch() override { return 1; }
  std::int32_t networkStart() override { return 0; }
  std::optional<std::int64_t> currentLayoutNumber() override { return std::nullopt; }
  std::optional<std::vector<InterfaceAddress>> addresses() override { return std::nullopt; }
  void disable() override {}
  void enable() override {}
  Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) override;
  bool boolean(const std::string&) override { return false; }
  std::optional<double> number(const std::string&) override { return std::nullopt; }
  std::vector<std::string> strings(const std::string&) override { return {}; }

 private:
  static constexpr ServiceStatus notBuilt = 38;  // ENOSYS

  EffectSink& _effects;
};

}  // namespace tavisk
