// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDLog.h"

namespace tavisk {

void SDLog::debug(std::string_view format, std::initializer_list<MessageValue> values) const {
  if (_defaults.boolean("StartupDiskDebug")) always(format, values);
}

void SDLog::always(std::string_view format, std::initializer_list<MessageValue> values) const {
  _systemLog.write(formatMessage(format, values));
}

}  // namespace tavisk
