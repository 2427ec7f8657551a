// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// An entry of the journal, as long as it is the one that is read.
class FoundJournalEntry {
 public:
  virtual ~FoundJournalEntry() = default;
  /// The first of that name (systemd.journal-fields(7)); absent without one, or where it cannot be read, which
  /// readJournal() then tells.
  virtual std::optional<std::string> field(const std::string& name) const = 0;
  /// Seconds since 1970 UTC, by the clock of the daemon when it took the entry.
  virtual std::int64_t time() const = 0;
};

/// What the journal of a machine is, beside its entries.
struct JournalState {
  bool isVolatile = false;            ///< kept in memory only: nothing is left of the time before the last start
  std::vector<Failure> leftOut = {};  ///< what is damaged: entries are missing
};

/// Hands on the entries of this machine's journal that have all of these fields ("NAME=VALUE"), the oldest first. The
/// failure says whether there is no journal (isAbsent()), this user may not read all of it (permission_denied), or it
/// cannot be read, also when all of it is damaged.
Result<JournalState> readJournal(const SystemRoot& root, const std::vector<std::string>& fields,
                                 const std::function<void(const FoundJournalEntry& entry)>& take);

}  // namespace tavisk
