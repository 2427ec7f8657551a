// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <deque>
#include <string>

#include "startupdisk/SDDisk.h"

namespace tavisk {

/// Volumes that wait for the long search, oldest first; a volume may wait several times. The caller locks, except for
/// the count.
class SearchQueue {
 public:
  std::size_t count() const { return _count; }
  void append(SDDiskRef volume);
  /// Null when the queue is empty.
  SDDiskRef takeOldest();
  /// Removes the oldest record of what is this disk now, wherever the same record object waits.
  void withdraw(const std::string& diskIdentifier);

 private:
  std::deque<SDDiskRef> _volumes;
  std::atomic<std::size_t> _count = 0;
};

}  // namespace tavisk
