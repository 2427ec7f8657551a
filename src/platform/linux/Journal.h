// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "platform/SystemRoot.h"

namespace tavisk {

/// One entry of the system log.
struct JournalEntry {
  int facility;  ///< syslog(3): LOG_AUTHPRIV, LOG_DAEMON
  int priority;  ///< syslog(3): LOG_DEBUG to LOG_EMERG
  std::string message;
  /// Further fields by name (systemd.journal-fields(7): capital letters, digits and underscores). Only the journal
  /// keeps them.
  std::vector<std::pair<std::string, std::string>> fields;
};

/// Sends entries to the journal by its own protocol, where there is none to syslog, where there is neither to nobody.
/// Texts are made harmless first (see escaped()). From any thread.
class Journal {
 public:
  /// The root must outlive the object.
  explicit Journal(const SystemRoot& root) : _root(root) {}
  void send(const JournalEntry& entry) const;

 private:
  const SystemRoot& _root;
};

}  // namespace tavisk
