// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/PowerSettingsService.h"

#include <algorithm>
#include <cstdint>

#include "effects/SettingNames.h"

namespace tavisk {

Minutes Minutes::covering(std::chrono::microseconds time) {
  const auto minutes = std::chrono::ceil<std::chrono::minutes>(time).count();
  return {static_cast<unsigned long>(std::max<std::int64_t>(minutes, 0))};
}

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
