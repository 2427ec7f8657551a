// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <initializer_list>
#include <string_view>

#include "platform/Preferences.h"
#include "platform/SystemLog.h"
#include "startupdisk/MessageFormat.h"

namespace tavisk {

/// The system log as the startup-disk code uses it. The services are not owned. From any thread.
class SDLog {
 public:
  SDLog(SystemLog& systemLog, UserDefaults& defaults) : _systemLog(systemLog), _defaults(defaults) {}

  /// Writes only while the user default "StartupDiskDebug" is true; it is read at each message.
  void debug(std::string_view format, std::initializer_list<MessageValue> values = {}) const;
  void always(std::string_view format, std::initializer_list<MessageValue> values = {}) const;

 private:
  SystemLog& _systemLog;
  UserDefaults& _defaults;
};

}  // namespace tavisk
