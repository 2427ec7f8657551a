// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "startupdisk/SDDisk.h"

namespace tavisk {

/// Who hears from the searcher: always on the main thread, in a later pass of the run loop, never inside a call of the
/// searcher.
class SystemSearcherProtocol {
 public:
  virtual ~SystemSearcherProtocol() = default;

  /// The delegate's own end-of-search notice; the searcher never sends it.
  virtual void searchCompleted() = 0;
  virtual void searchActivity() = 0;
  /// The context of the record holds the system description.
  virtual void foundSystemOnVolume(SDDiskRef system) = 0;
};

}  // namespace tavisk
