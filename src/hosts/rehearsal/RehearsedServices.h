// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "hosts/rehearsal/Stage.h"
#include "platform/BootLoaderFile.h"
#include "platform/ClockService.h"
#include "platform/DiskManagementService.h"
#include "platform/NameServices.h"
#include "platform/NetworkTimeService.h"
#include "platform/PowerController.h"
#include "platform/PowerSettingsService.h"
#include "platform/Processes.h"
#include "platform/RemoteAccess.h"

namespace tavisk {

// The services that change something. They are asked for what the copy has, and do to it what the machine would do.

class RehearsedClock final : public ClockService {
 public:
  explicit RehearsedClock(Stage& stage) : _stage(stage) {}

  std::int64_t now() override { return _stage.copy().clock().now(); }
  void setTime(std::int64_t secondsSince1970) override;
  std::vector<ZoneName> knownTimeZones() override { return _stage.copy().clock().knownTimeZones(); }
  ZoneName timeZone() override { return _stage.copy().clock().timeZone(); }
  void setTimeZone(const ZoneName& zone) override;
  std::string rulesOf(const ZoneName& zone) override { return _stage.machine().clock().rulesOf(zone); }

 private:
  Stage& _stage;
};

class RehearsedNetworkTime final : public NetworkTimeService {
 public:
  explicit RehearsedNetworkTime(Stage& stage) : _stage(stage) {}

  bool isRunning() override { return _stage.copy().networkTime().isRunning(); }
  void setLaunchAtStartup(bool launch) override;
  void checkLaunchAtStartup(bool launch) override;
  void start() override;
  void stop() override;
  NetworkTimeServer server() override { return _stage.copy().networkTime().server(); }
  void setServer(const NetworkTimeServer& server) override;
  void restartAsynchronously() override;

 private:
  Stage& _stage;
  bool _isServerChanged = false;  ///< since the client was last told to read it
};

class RehearsedPowerSettings final : public PowerSettingsService {
 public:
  explicit RehearsedPowerSettings(Stage& stage) : _stage(stage) {}

  Minutes untilSleep(SleepTimer timer, const PowerSource& source) override;
  void setUntilSleep(SleepTimer timer, const PowerSource& source, Minutes minutes) override;
  bool supports(PowerSwitch which, const PowerSource& source) override;
  bool canSet(PowerSwitch which, const PowerSource& source) override;
  bool isOn(PowerSwitch which, const PowerSource& source) override;
  void setOn(PowerSwitch which, const PowerSource& source, bool on) override;
  bool restartsAfterFreeze() override { return _stage.copy().powerSettings().restartsAfterFreeze(); }
  void setRestartsAfterFreeze(bool restarts) override;

 private:
  Stage& _stage;
};

/// Its statuses are the machine's.
class RehearsedPowerController final : public PowerController {
 public:
  explicit RehearsedPowerController(Stage& stage) : _stage(stage) {}

  ControllerStatus masterPort() override { return copy().masterPort(); }
  std::optional<Service> serviceOfClass(const std::string& className) override;
  std::optional<std::int64_t> numberProperty(const std::optional<Service>& service,
                                             const std::string& property) override;
  std::pair<ControllerStatus, Connection> open(const std::optional<Service>& service,
                                               std::uint32_t connectionType) override;
  ControllerStatus setProperties(const Connection& connection, const PropertyList::Dictionary& properties,
                                 std::int64_t asked) override;
  ControllerStatus close(const Connection& connection) override { return copy().close(connection); }

 private:
  PowerController& copy() { return _stage.copy().powerController(); }

  Stage& _stage;
};

/// Remote login, or remote events. The copy knows them as on or off alone.
template <typename Service>
class RehearsedRemoteAccess final : public Service {
 public:
  /// The service of a host.
  using Finder = Service& (*)(Host& host);

  /// `setting` is its name and `section` that of the copy's file.
  RehearsedRemoteAccess(Stage& stage, Finder serviceOf, const char* setting, const char* section)
      : _stage(stage), _serviceOf(serviceOf), _setting(setting), _section(section) {}

  RemoteAccessState state() override;
  void setEnabled(bool enabled) override;

 private:
  Stage& _stage;
  Finder _serviceOf;
  const char* _setting;
  const char* _section;
};

class RehearsedHostConfiguration final : public HostConfigService {
 public:
  /// Whether a machine without a computer name shows its host name as one.
  RehearsedHostConfiguration(Stage& stage, bool showsHostName) : _stage(stage), _showsHostName(showsHostName) {}

  void setComputerName(const std::string& name) override;
  void setLocalNetworkName(const std::string& name) override;

 private:
  void showHostName();
  bool hasComputerName();

  Stage& _stage;
  bool _showsHostName;
};

class RehearsedBootLoaderFile final : public BootLoaderFile {
 public:
  explicit RehearsedBootLoaderFile(Stage& stage) : _stage(stage) {}

  Result<std::optional<PropertyList::Dictionary>> read() override { return _stage.copy().bootLoaderFile().read(); }
  bool write(const PropertyList::Dictionary& contents) override;

 private:
  Stage& _stage;
};

/// The disks and the firmware are the machine's. What is chosen to start next is remembered, and written to the copy.
class RehearsedDiskManagement final : public DiskManagementService {
 public:
  explicit RehearsedDiskManagement(Stage& stage) : _stage(stage) {}

  bool is(DiskTrait trait, const DiskName& disk) override { return machine().is(trait, disk); }
  std::string protocolOf(const DiskName& disk) override { return machine().protocolOf(disk); }
  std::string nameOf(DiskProtocol protocol) override { return machine().nameOf(protocol); }
  int partitionScheme(const DiskName& disk) override { return machine().partitionScheme(disk); }
  OpticalBootability opticalBootability(const DiskName& disk) override { return machine().opticalBootability(disk); }

  int preBootEnvironment() override { return machine().preBootEnvironment(); }
  LegacyBootSupport legacyBootSupport() override { return machine().legacyBootSupport(); }
  BootPreference bootPreference() override;
  NetworkBootPreference networkBootPreference() override;
  ServiceStatus setBootPreference(const BootChoice& choice) override;
  ServiceStatus setFirmwareVariable(const std::string& name, const Result<std::string>& value) override;

 private:
  DiskManagementService& machine() { return _stage.machine().diskManagement(); }
  ServiceStatus change(const std::function<ServiceStatus(DiskManagementService&)>& set);

  Stage& _stage;
  std::optional<DiskName> _chosen;  ///< absent: what the machine starts
};

/// What is set of preferences and keyboards is foretold when it is written out.
class RehearsedProcesses final : public ProcessUtilities {
 public:
  explicit RehearsedProcesses(Stage& stage) : _stage(stage) {}

  ProcessId processNamed(const std::string& name) override { return _stage.machine().processes().processNamed(name); }
  void sendSignal(int signal, ProcessId process) override;
  void setLockEnclosureState(bool disablesKeyboard) override;
  void setMachineBoolean(const std::string& key, bool value) override;
  void writeMachinePreferences() override;

 private:
  Stage& _stage;
  std::vector<std::function<void(ProcessUtilities&)>> _pending;
};

}  // namespace tavisk
