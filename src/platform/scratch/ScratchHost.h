// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include "platform/Host.h"
#include "platform/RootedFileSystem.h"
#include "platform/scratch/EffectsLog.h"
#include "platform/scratch/MachineFile.h"
#include "platform/scratch/MachineSettings.h"
#include "platform/scratch/ScratchAdminAuthenticator.h"
#include "platform/scratch/ScratchBootLoaderFile.h"
#include "platform/scratch/ScratchClockService.h"
#include "platform/scratch/ScratchDiskEventSession.h"
#include "platform/scratch/ScratchDiskManagement.h"
#include "platform/scratch/ScratchDisks.h"
#include "platform/scratch/ScratchDynamicStore.h"
#include "platform/scratch/ScratchHostConfigService.h"
#include "platform/scratch/ScratchIORegistry.h"
#include "platform/scratch/ScratchKernelValues.h"
#include "platform/scratch/ScratchKeyboardInputService.h"
#include "platform/scratch/ScratchNetworkInterfaces.h"
#include "platform/scratch/ScratchNetworkTimeService.h"
#include "platform/scratch/ScratchPowerController.h"
#include "platform/scratch/ScratchPowerSettingsService.h"
#include "platform/scratch/ScratchPreferencesStore.h"
#include "platform/scratch/ScratchProcessTermination.h"
#include "platform/scratch/ScratchProcessUtilities.h"
#include "platform/scratch/ScratchProgramRunner.h"
#include "platform/scratch/ScratchRemoteEventsService.h"
#include "platform/scratch/ScratchRemoteShellService.h"
#include "platform/scratch/ScratchSystemLog.h"
#include "platform/scratch/ScratchUserDatabase.h"
#include "platform/scratch/ScratchUserDefaults.h"

namespace tavisk {

/// A machine that the files of one folder, DIR, describe: machine.plist its settings, root/ its files, system.log and
/// effects.log what it was told.
class ScratchHost final : public Host {
 public:
  /// Fails when DIR is no folder or its machine.plist is not sound. Adds the effects.log to the channels of `effects`;
  /// the host must be alive whenever effects are told.
  static Result<std::unique_ptr<ScratchHost>> open(const std::string& directory, EffectSink& effects, RunLoop& runLoop);

  UserDatabase& users() override { return _users; }
  AdminAuthenticator& authenticator() override { return _authenticator; }
  FileSystem& files() override { return _files; }
  SystemLog& systemLog() override { return _systemLog; }
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
  ScratchHost(const std::string& directory, std::unique_ptr<MachineFile> machine, EffectSink& effects,
              RunLoop& runLoop);

  std::unique_ptr<MachineFile> _machine;
  MachineSettings _settings;
  EffectsLog _effectsLog;
  SystemRoot _root;
  RootedFileSystem _files;
  ScratchUserDatabase _users;
  ScratchAdminAuthenticator _authenticator;
  ScratchSystemLog _systemLog;
  ScratchClockService _clock;
  ScratchNetworkTimeService _networkTime;
  ScratchPowerSettingsService _powerSettings;
  ScratchPowerController _powerController;
  ScratchRemoteShellService _remoteShell;
  ScratchRemoteEventsService _remoteEvents;
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
};

}  // namespace tavisk
