// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/Authorization.h"
#include "platform/BootLoaderFile.h"
#include "platform/ChangeHistory.h"
#include "platform/ClockService.h"
#include "platform/DiskEventSession.h"
#include "platform/DiskManagementService.h"
#include "platform/FileSystem.h"
#include "platform/IORegistry.h"
#include "platform/MachineFacts.h"
#include "platform/NameServices.h"
#include "platform/NetworkTimeService.h"
#include "platform/PowerController.h"
#include "platform/PowerSettingsService.h"
#include "platform/Preferences.h"
#include "platform/Processes.h"
#include "platform/RemoteAccess.h"
#include "platform/ResetService.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// The machine that the tool reads and changes: one service each, made at first use and owned by the host.
class Host {
 public:
  virtual ~Host() = default;

  virtual UserDatabase& users() = 0;
  virtual AdminAuthenticator& authenticator() = 0;
  virtual FileSystem& files() = 0;
  virtual SystemLog& systemLog() = 0;
  virtual ChangeHistory& history() = 0;
  virtual ClockService& clock() = 0;
  virtual NetworkTimeService& networkTime() = 0;
  virtual PowerSettingsService& powerSettings() = 0;
  virtual PowerController& powerController() = 0;
  virtual RemoteShellService& remoteShell() = 0;
  virtual RemoteEventsService& remoteEvents() = 0;
  virtual HostConfigService& hostConfiguration() = 0;
  virtual DynamicStore& dynamicStore() = 0;
  virtual BootLoaderFile& bootLoaderFile() = 0;
  virtual PreferencesStore& preferences() = 0;
  virtual ProcessUtilities& processes() = 0;
  virtual ResetService& resets() = 0;

  virtual DiskEventSession& diskEvents() = 0;
  virtual DiskManagementService& diskManagement() = 0;
  virtual IORegistry& registry() = 0;
  virtual NetworkInterfaces& networkInterfaces() = 0;
  virtual KernelValues& kernel() = 0;
  virtual KeyboardInputService& keyboardInput() = 0;
  virtual UserDefaults& userDefaults() = 0;
  virtual ProgramRunner& programs() = 0;
  virtual ProcessTermination& processTermination() = 0;
};

}  // namespace tavisk
