// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include "hosts/rehearsal/CopiedFiles.h"
#include "hosts/rehearsal/MachineCopy.h"
#include "hosts/rehearsal/RehearsedServices.h"
#include "hosts/rehearsal/Stage.h"
#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/ScratchHost.h"
#include "platform/Host.h"

namespace tavisk {

/// A machine that only foretells what is done to it, with the sink to which it tells that.
struct ForetellingMachine {
  std::unique_ptr<EffectSink> effects;
  std::unique_ptr<Host> host;
  bool showsHostName = false;  ///< as its computer name, where it has none
};

/// A machine and its copy in files, on which is done what the machine would do: what is changed is changed there alone.
/// Which disks and files there are the machine is asked; a copy that has disks gets the files that are looked at.
class RehearsalHost final : public Host {
 public:
  /// Copies the machine there. Effects are told as the machine would tell them.
  static Result<std::unique_ptr<RehearsalHost>> open(ForetellingMachine machine, const PlaceOfCopy& place,
                                                     EffectSink& effects, RunLoop& runLoop);

  UserDatabase& users() override { return _copy->users(); }
  AdminAuthenticator& authenticator() override { return _copy->authenticator(); }
  FileSystem& files() override {
    if (_copiedFiles) return *_copiedFiles;
    return _machine.host->files();
  }
  SystemLog& systemLog() override { return _copy->systemLog(); }
  ClockService& clock() override { return _clock; }
  NetworkTimeService& networkTime() override { return _networkTime; }
  PowerSettingsService& powerSettings() override { return _powerSettings; }
  PowerController& powerController() override { return _powerController; }
  RemoteShellService& remoteShell() override { return _remoteShell; }
  RemoteEventsService& remoteEvents() override { return _remoteEvents; }
  HostConfigService& hostConfiguration() override { return _hostConfiguration; }
  DynamicStore& dynamicStore() override { return _copy->dynamicStore(); }
  BootLoaderFile& bootLoaderFile() override { return _bootLoaderFile; }
  PreferencesStore& preferences() override { return _copy->preferences(); }
  ProcessUtilities& processes() override { return _processes; }
  /// Foretold by the machine: no word resets.
  ResetService& resets() override { return _machine.host->resets(); }

  DiskEventSession& diskEvents() override { return _machine.host->diskEvents(); }
  DiskManagementService& diskManagement() override { return _diskManagement; }
  IORegistry& registry() override { return _machine.host->registry(); }
  NetworkInterfaces& networkInterfaces() override { return _machine.host->networkInterfaces(); }
  KernelValues& kernel() override { return _copy->kernel(); }
  KeyboardInputService& keyboardInput() override { return _copy->keyboardInput(); }
  UserDefaults& userDefaults() override { return _machine.host->userDefaults(); }
  ProgramRunner& programs() override { return _machine.host->programs(); }
  ProcessTermination& processTermination() override { return _copy->processTermination(); }
  ChangeHistory& history() override { return _copy->history(); }

 private:
  struct Copy {
    std::unique_ptr<EffectSink> effects;
    std::unique_ptr<Host> host;
    std::unique_ptr<MachineFile> file;
    std::unique_ptr<CopiedFiles> files;
  };
  RehearsalHost(ForetellingMachine machine, Copy copy, EffectSink& effects);

  ForetellingMachine _machine;
  std::unique_ptr<EffectSink> _copyEffects;
  std::unique_ptr<Host> _copy;
  std::unique_ptr<MachineFile> _copyFile;
  std::unique_ptr<CopiedFiles> _copiedFiles;  ///< null: the copy has no disks
  Stage _stage;
  RehearsedClock _clock;
  RehearsedNetworkTime _networkTime;
  RehearsedPowerSettings _powerSettings;
  RehearsedPowerController _powerController;
  RehearsedRemoteAccess<RemoteShellService> _remoteShell;
  RehearsedRemoteAccess<RemoteEventsService> _remoteEvents;
  RehearsedHostConfiguration _hostConfiguration;
  RehearsedBootLoaderFile _bootLoaderFile;
  RehearsedDiskManagement _diskManagement;
  RehearsedProcesses _processes;
};

}  // namespace tavisk
