// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/PowerSettingsService.h"

#include "effects/SettingNames.h"

namespace tavisk {

std::string textOf(Minutes minutes) {
  return std::to_string(minutes.count);
}

const char* nameOf(SleepTimer timer) {
  switch (timer) {
    case SleepTimer::computer:
      return setting::computerSleep;
    case SleepTimer::display:
      return setting::displaySleep;
    case SleepTimer::hardDisk:
      break;
  }
  return setting::hardDiskSleep;
}

const char* nameOf(PowerSwitch which) {
  switch (which) {
    case PowerSwitch::wakeOnModem:
      return setting::wakeOnModem;
    case PowerSwitch::wakeOnNetworkAccess:
      return setting::wakeOnNetworkAccess;
    case PowerSwitch::restartAfterPowerFailure:
      return setting::restartAfterPowerFailure;
    case PowerSwitch::powerButtonSleep:
      break;
  }
  return setting::powerButtonSleep;
}

}  // namespace tavisk
