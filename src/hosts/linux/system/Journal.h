// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// What all entries of this program are found by.
inline constexpr const char* journalIdentifier = "tavisk";
/// What is longer is cut: the journal takes larger entries by another way only.
inline constexpr std::size_t longestJournalField = 16384;

/// The fields of an effect by which changes are found again. Values are escaped(), with \n for a newline.
namespace journalfield {
inline constexpr const char* run = "TAVISK_RUN";
inline constexpr const char* setting = "TAVISK_SETTING";
inline constexpr const char* outcome = "TAVISK_OUTCOME";
inline constexpr const char* changed = "TAVISK_CHANGED";  ///< "yes" or "no"
inline constexpr const char* before = "TAVISK_OLD";
inline constexpr const char* after = "TAVISK_NEW";
inline constexpr const char* beforeUnknown = "TAVISK_OLD_UNKNOWN";  ///< "yes": it could not be read
}  // namespace journalfield
/// In place of an outcome.
inline constexpr const char* outcomeOfBeginning = "begins";

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

/// Writes each change, and each failed read, as one entry of the system log: what was asked and what became of it, who
/// asked, and at which terminal. The beginning of a change is an entry of debug priority.
class JournalLog final : public EffectChannel {
 public:
  /// The root must outlive the object. Made before there are threads that change the environment.
  explicit JournalLog(const SystemRoot& root);
  void changeBegins(const std::string& setting, const std::string& asked) override;
  void record(const Effect& effect) override;
  /// That the tool was not run for the user of this process: user id, name and terminal.
  void noteRefusedUser() const;

 private:
  void send(int priority, const std::string& message, std::vector<std::pair<std::string, std::string>> fields) const;

  const SystemRoot& _root;
  Journal _journal;
  std::string _run;
  std::string _sudoUser;  ///< empty: unknown
};

/// The system log: the journal, else syslog.
class LinuxSystemLog final : public SystemLog {
 public:
  /// The root must outlive the object.
  explicit LinuxSystemLog(const SystemRoot& root) : _journal(root) {}
  void write(const std::string& message) override;

 private:
  Journal _journal;
};

}  // namespace tavisk
