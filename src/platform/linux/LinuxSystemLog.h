// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/SystemLog.h"
#include "platform/linux/Journal.h"

namespace tavisk {

/// The system log: the journal, else syslog.
class LinuxSystemLog : public SystemLog {
 public:
  /// The root must outlive the object.
  explicit LinuxSystemLog(const SystemRoot& root) : _journal(root) {}
  void write(const std::string& message) override;

 private:
  Journal _journal;
};

}  // namespace tavisk
