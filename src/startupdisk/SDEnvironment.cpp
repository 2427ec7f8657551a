// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDEnvironment.h"

namespace tavisk {

SDEnvironment::SDEnvironment(Host& theHost, RunLoop& theRunLoop, NotificationCenter& theNotifications)
    : host(theHost),
      runLoop(theRunLoop),
      notifications(theNotifications),
      log(theHost.systemLog(), theHost.userDefaults()) {}

}  // namespace tavisk
