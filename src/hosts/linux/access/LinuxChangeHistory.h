// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/shared/SystemRoot.h"
#include "platform/ChangeHistory.h"

namespace tavisk {

/// The effects in the journal. Anybody may write entries there in this program's name: only the journal's own account
/// of who wrote one (systemd.journal-fields(7), trusted fields) is believed, and only that of administrators counts.
class LinuxChangeHistory final : public ChangeHistory {
 public:
  /// The root must outlive the object.
  explicit LinuxChangeHistory(const SystemRoot& root) : _root(root) {}
  Result<RecordedChanges> changes() override;

 private:
  const SystemRoot& _root;
};

}  // namespace tavisk
