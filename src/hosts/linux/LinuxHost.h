// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/linux/access/LinuxAuthorization.h"
#include "hosts/linux/access/LinuxChangeHistory.h"
#include "hosts/linux/access/LinuxRemoteAccess.h"
#include "hosts/linux/clock/LinuxClockService.h"
#include "hosts/linux/clock/LinuxNetworkTimeService.h"
#include "hosts/linux/disks/LinuxDiskEventSession.h"
#include "hosts/linux/machine/LinuxBootLoaderFile.h"
#include "hosts/linux/machine/LinuxIORegistry.h"
#include "hosts/linux/machine/LinuxMachineFacts.h"
#include "hosts/linux/machine/LinuxPreferences.h"
#include "hosts/linux/machine/LinuxProcesses.h"
#include "hosts/linux/names/LinuxNameServices.h"
#include "hosts/linux/power/LinuxPowerController.h"
#include "hosts/linux/power/LinuxPowerSettingsService.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/Journal.h"
#include "hosts/linux/systems/LinuxDiskManagementService.h"
#include "hosts/linux/systems/SystemFiles.h"
#include "hosts/shared/Resets.h"
#include "hosts/shared/RootedFileSystem.h"
#include "platform/Host.h"

namespace tavisk {

/// The machine that the tool runs on. Nothing is asked of it until a service is used.
class LinuxHost final : public Host {
 public:
  /// Adds the system log to the channels of `effects`; the host must be alive whenever effects are told. With a root
  /// other than "/" the files, sockets and processes are those beneath that folder; the users and the clock are this
  /// machine's, and the clock is not set. A forecast is told to `effects` alone.
  LinuxHost(EffectSink& effects, RunLoop& runLoop, const std::string& root = "/", Conduct conduct = Conduct::change);

  UserDatabase& users() override { return _users; }
  AdminAuthenticator& authenticator() override { return _authenticator; }
  FileSystem& files() override { return _systemFiles; }
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
  void explainToLog(const std::string& why);

  SystemRoot _root;
  JournalLog _journalLog;
  ServiceAccess _services;
  LinuxMachine _machine;
  LinuxUserDatabase _users;
  LinuxAdminAuthenticator _authenticator;
  RootedFileSystem _files;
  LinuxSystemLog _systemLog;
  LinuxChangeHistory _history;
  LinuxClockService _clock;
  LinuxNetworkTimeService _networkTime;
  LinuxRemoteShellService _remoteShell;
  LinuxRemoteEventsService _remoteEvents;
  LinuxHostConfigService _hostConfiguration;
  LinuxDynamicStore _dynamicStore;
  FirstConsole _console;
  KernelNetworkCards _networkCards;
  IpmiDevice _controllerLink;
  ManagementController _controller;
  LinuxPowerSettingsService _powerSettings;
  LinuxPowerController _powerController;
  LinuxBootLoaderFile _bootLoaderFile;
  LinuxDisks _disks;
  LinuxUserDefaults _userDefaults;
  LinuxSystems _systems;
  SystemFiles _systemFiles;
  LinuxDiskEventSession _diskEvents;
  LinuxDiskManagementService _diskManagement;
  LinuxIORegistry _registry;
  LinuxNetworkInterfaces _networkInterfaces;
  LinuxKernelValues _kernel;
  LinuxKeyboardInputService _keyboardInput;
  LinuxProgramRunner _programs;
  LinuxProcessTermination _processTermination;
  LinuxPreferencesStore _preferences;
  LinuxProcessUtilities _processes;
  Resets _resets;
};

}  // namespace tavisk
