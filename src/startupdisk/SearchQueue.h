// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <list>
#include <string>
#include <unordered_map>

#include "startupdisk/SDDisk.h"

namespace tavisk {

/// Volumes that wait for the long search, oldest first; a volume may wait several times. The caller locks, except for
/// the count.
class SearchQueue {
 public:
  std::size_t count() const { return _count; }
  void append(SDDiskRef volume);
  /// The queue must not be empty.
  SDDiskRef takeOldest();
  /// Removes the oldest record of this disk, wherever the same record object waits.
  void withdraw(const std::string& diskIdentifier);

 private:
  using Places = std::list<SDDiskRef>;
  Places _volumes;
  std::unordered_map<std::string, std::list<Places::iterator>> _placesOfDisk;
  std::atomic<std::size_t> _count = 0;
};

}  // namespace tavisk
