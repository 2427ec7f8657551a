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
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/LinuxNetworkTimeService.h"
#include "platform/linux/LinuxSystemLog.h"
#include "platform/linux/LinuxUserDatabase.h"
#include "platform/linux/UnbuiltNames.h"
#include "platform/linux/UnbuiltPower.h"
#include "platform/linux/UnbuiltProcesses.h"
#include "platform/linux/UnbuiltRemoteAccess.h"
#include "platform/linux/UnbuiltStartupDisk.h"

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

  DiskEventSession& diskEvents() override { return _startupDisk; }
  DiskManagementService& diskManagement() override { return _startupDisk; }
  IORegistry& registry() override { return _startupDisk; }
  NetworkInterfaces& networkInterfaces() override { return _startupDisk; }
  KernelValues& kernel() override { return _startupDisk; }
  KeyboardInputService& keyboardInput() override { return _startupDisk; }
  UserDefaults& userDefaults() override { return _startupDisk; }
  ProgramRunner& programs() override { return _startupDisk; }
  ProcessTermination& processTermination() override { return _startupDisk; }

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
  UnbuiltPowerSettings _powerSettings;
  UnbuiltPowerController _powerController;
  UnbuiltRemoteShell _remoteShell;
  UnbuiltRemoteEvents _remoteEvents;
  UnbuiltHostConfig _hostConfiguration;
  UnbuiltDynamicStore _dynamicStore;
  LinuxBootLoaderFile _bootLoaderFile;
  UnbuiltPreferences _preferences;
  UnbuiltProcesses _processes;
  UnbuiltStartupDisk _startupDisk;
};

}  // namespace tavisk
