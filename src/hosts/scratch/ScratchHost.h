// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/MachineSettings.h"
#include "hosts/scratch/ScratchAuthorization.h"
#include "hosts/scratch/ScratchBootLoaderFile.h"
#include "hosts/scratch/ScratchClockService.h"
#include "hosts/scratch/ScratchDiskEventSession.h"
#include "hosts/scratch/ScratchDiskManagement.h"
#include "hosts/scratch/ScratchDisks.h"
#include "hosts/scratch/ScratchIORegistry.h"
#include "hosts/scratch/ScratchLogs.h"
#include "hosts/scratch/ScratchMachineFacts.h"
#include "hosts/scratch/ScratchNameServices.h"
#include "hosts/scratch/ScratchNetworkTimeService.h"
#include "hosts/scratch/ScratchPowerController.h"
#include "hosts/scratch/ScratchPowerSettingsService.h"
#include "hosts/scratch/ScratchPreferences.h"
#include "hosts/scratch/ScratchProcesses.h"
#include "hosts/scratch/ScratchRemoteAccess.h"
#include "hosts/shared/Resets.h"
#include "hosts/shared/RootedFileSystem.h"
#include "platform/Host.h"

namespace tavisk {

/// A machine that the files of one folder, DIR, describe: machine.plist its settings, root/ its files, system.log and
/// effects.log what it was told.
class ScratchHost final : public Host {
 public:
  /// Fails when DIR is no folder or its machine.plist is not sound. Adds the effects.log to the channels of `effects`;
  /// the host must be alive whenever effects are told.
  /// A forecast is told to `effects` alone.
  static Result<std::unique_ptr<ScratchHost>> open(const std::string& directory, EffectSink& effects, RunLoop& runLoop,
                                                   Conduct conduct = Conduct::change);

  /// In one line, the names in machine.plist that seem to be misspelt; empty when there is none.
  std::string misspellings() const;

  UserDatabase& users() override { return _users; }
  AdminAuthenticator& authenticator() override { return _authenticator; }
  FileSystem& files() override { return _files; }
  SystemLog& systemLog() override { return _systemLog; }
  ChangeHistory& history() override { return _history; }
  ClockService& clock() override { return _clock; }
  NetworkTimeService& networkTime() override { return _networkTime; }
  PowerSettingsService& powerSettings() override { return _powerSettings; }
  PowerController& powerController() override { return _powerController; }
  RemoteShellService& remoteShell() override { return _remoteShell; }
  RemoteEventsService& remoteEvents() override { return _remoteEvents; }
  HostConfigService& hostConfiguration() override { return _hostConfiguration; }
  DynamicStore& dynamicStore() override { return _dynamicStore; }
  BootLoaderFile& bootLoaderFile() override { return _bootLoaderFile; }
  PreferencesStore& preferences() override { return _preferences; }
  ProcessUtilities& processes() override { return _processes; }
  ResetService& resets() override { return _resets; }

  DiskEventSession& diskEvents() override { return _diskEvents; }
  DiskManagementService& diskManagement() override { return _diskManagement; }
  IORegistry& registry() override { return _registry; }
  NetworkInterfaces& networkInterfaces() override { return _networkInterfaces; }
  KernelValues& kernel() override { return _kernel; }
  KeyboardInputService& keyboardInput() override { return _keyboardInput; }
  UserDefaults& userDefaults() override { return _userDefaults; }
  ProgramRunner& programs() override { return _programs; }
  ProcessTermination& processTermination() override { return _processTermination; }

 private:
  ScratchHost(const std::string& directory, std::unique_ptr<MachineFile> machine, EffectSink& effects, RunLoop& runLoop,
              Conduct conduct);

  std::unique_ptr<MachineFile> _machine;
  MachineSettings _settings;
  EffectsLog _effectsLog;
  SystemRoot _root;
  RootedFileSystem _files;
  ScratchUserDatabase _users;
  ScratchAdminAuthenticator _authenticator;
  ScratchSystemLog _systemLog;
  ScratchChangeHistory _history;
  ScratchClockService _clock;
  ScratchNetworkTimeService _networkTime;
  ScratchPowerSettingsService _powerSettings;
  ScratchPowerController _powerController;
  ScratchRemoteAccess<RemoteShellService> _remoteShell;
  ScratchRemoteAccess<RemoteEventsService> _remoteEvents;
  ScratchHostConfigService _hostConfiguration;
  ScratchDynamicStore _dynamicStore;
  ScratchBootLoaderFile _bootLoaderFile;
  ScratchPreferencesStore _preferences;
  ScratchProcessUtilities _processes;
  ScratchDisks _disks;
  ScratchDiskEventSession _diskEvents;
  ScratchDiskManagement _diskManagement;
  ScratchIORegistry _registry;
  ScratchNetworkInterfaces _networkInterfaces;
  ScratchKernelValues _kernel;
  ScratchKeyboardInputService _keyboardInput;
  ScratchUserDefaults _userDefaults;
  ScratchProgramRunner _programs;
  ScratchProcessTermination _processTermination;
  Resets _resets;
};

}  // namespace tavisk
