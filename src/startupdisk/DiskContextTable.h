// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <unordered_map>

#include "startupdisk/SDRecord.h"

namespace tavisk {

/// What the startup-disk code has learnt of each disk, by disk identifier: one table for all records, so that all
/// records of a disk share one context. It lives as long as the run. From any thread.
class DiskContextTable {
 public:
  using Context = std::map<std::string, ContextValue>;

  /// Absent when nothing was ever stored for the disk.
  std::optional<Context> context(const std::string& diskIdentifier) const;
  std::optional<ContextValue> object(const std::string& diskIdentifier, const std::string& key) const;
  void setObject(const std::string& diskIdentifier, const std::string& key, ContextValue value);
  void removeObject(const std::string& diskIdentifier, const std::string& key);

 private:
  mutable std::mutex _mutex;
  std::unordered_map<std::string, Context> _contexts;
};

}  // namespace tavisk
