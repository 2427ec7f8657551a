// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/PowerSettingsService.h"

#include "platform/SettingNames.h"

namespace tavisk {

const char* nameOf(SleepTimer timer) {
  switch (timer) {
    case SleepTimer::system:
      return setting::computerSleep;
    case SleepTimer::display:
      return setting::displaySleep;
    case SleepTimer::disk:
      break;
  }
  return setting::hardDiskSleep;
}

const char* nameOf(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnRing:
      return setting::wakeOnModem;
    case PowerSwitch::wakeOnLAN:
      return setting::wakeOnNetworkAccess;
    case PowerSwitch::autoRestart:
      return setting::restartAfterPowerFailure;
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return setting::powerButtonSleep;
}

}  // namespace tavisk
