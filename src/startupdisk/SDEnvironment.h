// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <map>
#include <optional>
#include <string>

#include "base/NotificationCenter.h"
#include "base/RunLoop.h"
#include "platform/Host.h"
#include "startupdisk/DiskContextTable.h"
#include "startupdisk/SDDisk.h"
#include "startupdisk/SDLog.h"

namespace tavisk {

/// What the startup-disk code has learnt of the machine; each is worked out once a run. Main thread only, but for the
/// flag.
struct SDMachineFacts {
  std::optional<bool> excludesLumara9;
  std::optional<bool> startedFromNetwork;
  std::atomic<bool> networkPreferenceAsked = false;
  std::optional<std::string> bootDevice;                              ///< the firmware variable "boot-device"
  std::optional<std::map<std::string, std::string>> interfaceOfPath;  ///< from device-tree path to BSD name
};

/// What all startup-disk code of a run works with.
struct SDEnvironment {
  /// Nothing that is given is owned.
  SDEnvironment(Host& theHost, RunLoop& theRunLoop, NotificationCenter& theNotifications)
      : host(theHost),
        runLoop(theRunLoop),
        notifications(theNotifications),
        log(theHost.systemLog(), theHost.userDefaults()) {}

  SDDiskServices diskServices() { return {host.diskEvents(), host.diskManagement(), contexts}; }

  Host& host;
  RunLoop& runLoop;
  NotificationCenter& notifications;
  SDLog log;
  DiskContextTable contexts;
  SDMachineFacts facts;
};

}  // namespace tavisk
