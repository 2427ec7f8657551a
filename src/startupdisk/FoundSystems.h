// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <list>
#include <string>
#include <unordered_map>
#include <vector>

#include "startupdisk/SDDisk.h"

namespace tavisk {

/// The systems that were found, by system-folder path, in the order in which they were found.
class FoundSystems {
 public:
  /// Replaces what was stored under the path; the new one is the latest.
  void store(const std::string& path, SDDiskRef system);
  /// What was stored under the path; null when there was nothing.
  SDDiskRef remove(const std::string& path);
  std::vector<std::string> pathsOnDisk(const std::string& diskIdentifier) const;
  /// Null when there is none.
  SDDiskRef find(const std::string& path) const;
  std::vector<SDDiskRef> all() const;

 private:
  struct Entry {
    std::string path;
    std::string disk;
    SDDiskRef system;
  };
  using Place = std::list<Entry>::iterator;

  std::list<Entry> _entries;
  std::unordered_map<std::string, Place> _byPath;
  std::unordered_map<std::string, std::vector<std::string>> _pathsOfDisk;
};

}  // namespace tavisk
