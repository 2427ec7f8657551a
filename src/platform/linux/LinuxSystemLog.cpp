// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxSystemLog.h"

#include <syslog.h>

namespace tavisk {

void LinuxSystemLog::write(const std::string& message) {
  bool ended = message.ends_with('\n');
  _journal.send({LOG_DAEMON, LOG_INFO, message.substr(0, message.size() - (ended ? 1 : 0)), {}});
}

}  // namespace tavisk
