// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"

namespace tavisk {

/// One effect that has changed something, as the machine's records tell it.
struct RecordedChange {
  std::string run;                    ///< the same of all that one run of the program did, and of nothing else
  std::int64_t time = 0;              ///< seconds since 1970 UTC, by the machine's clock as it was then
  std::string setting;                ///< one of effects/SettingNames.h
  std::optional<std::string> before;  ///< the live value before, else the stored one; absent: none, or not known
  std::optional<std::string> after;   ///< the same of after
  bool isEnded = true;                ///< false: a change was begun, and what became of it is not told
  bool isBeforeKnown = true;          ///< tells the one from the other where it is absent
  bool isAfterKnown = true;           ///< the same

  bool operator==(const RecordedChange&) const = default;
};

struct RecordedChanges {
  std::vector<RecordedChange> changes;  ///< the oldest first
  /// Lines for people: what is missing among the changes, and why.
  std::vector<std::string> remarks;
};

/// What this program has changed on the machine, by the records that it left there.
class ChangeHistory {
 public:
  virtual ~ChangeHistory() = default;

  /// Only changes by users who are or were allowed to make them. A failure says whether there are no records, they are
  /// refused to this user (by its code), or cannot be read.
  virtual Result<RecordedChanges> changes() = 0;
};

}  // namespace tavisk
