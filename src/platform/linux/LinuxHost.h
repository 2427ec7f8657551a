// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/Host.h"
#include "platform/RootedFileSystem.h"
#include "platform/linux/JournalLog.h"
#include "platform/linux/LinuxAdminAuthenticator.h"
#include "platform/linux/LinuxBootLoaderFile.h"
#include "platform/linux/LinuxClockService.h"
#include "platform/linux/LinuxDiskEventSession.h"
#include "platform/linux/LinuxDiskManagementService.h"
#include "platform/linux/LinuxDynamicStore.h"
#include "platform/linux/LinuxHostConfigService.h"
#include "platform/linux/LinuxIORegistry.h"
#include "platform/linux/LinuxKernelValues.h"
#include "platform/linux/LinuxKeyboardInputService.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/LinuxNetworkInterfaces.h"
#include "platform/linux/LinuxNetworkTimeService.h"
#include "platform/linux/LinuxPowerController.h"
#include "platform/linux/LinuxPowerSettingsService.h"
#include "platform/linux/LinuxPreferencesStore.h"
#include "platform/linux/LinuxProcessTermination.h"
#include "platform/linux/LinuxProcessUtilities.h"
#include "platform/linux/LinuxProgramRunner.h"
#include "platform/linux/LinuxRemoteEventsService.h"
#include "platform/linux/LinuxRemoteShellService.h"
#include "platform/linux/LinuxSystemLog.h"
#include "platform/linux/LinuxUserDatabase.h"
#include "platform/linux/LinuxUserDefaults.h"

namespace tavisk {

/// The machine that the tool runs on. Nothing is asked of it until a service is used.
class LinuxHost final : public Host {
 public:
  /// Adds the system log to the channels of `effects`; the host must be alive whenever effects are told. With a root
  /// other than "/" the files, sockets and processes are those beneath that folder; the users and the clock are this
  /// machine's, and the clock is not set.
  LinuxHost(EffectSink& effects, RunLoop& runLoop, const std::string& root = "/");

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
  SystemRoot _root;
  JournalLog _journalLog;
  ServiceAccess _services;
  LinuxMachine _machine;
  LinuxUserDatabase _users;
  LinuxAdminAuthenticator _authenticator;
  RootedFileSystem _files;
  LinuxSystemLog _systemLog;
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
  LinuxDiskEventSession _diskEvents;
  LinuxDiskManagementService _diskManagement;
  LinuxIORegistry _registry;
  LinuxNetworkInterfaces _networkInterfaces;
  LinuxKernelValues _kernel;
  LinuxKeyboardInputService _keyboardInput;
  LinuxUserDefaults _userDefaults;
  LinuxProgramRunner _programs;
  LinuxProcessTermination _processTermination;
  LinuxPreferencesStore _preferences;
  LinuxProcessUtilities _processes;
};

}  // namespace tavisk
