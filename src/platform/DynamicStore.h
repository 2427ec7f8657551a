// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

namespace tavisk {

/// What the machine currently goes by, which may lag behind what is configured.
class DynamicStore {
 public:
  virtual ~DynamicStore() = default;

  /// Its end closes it.
  class Session {
   public:
    virtual ~Session() = default;

    /// Absent when the machine has none.
    virtual std::optional<std::string> computerName() = 0;
    virtual std::optional<std::string> localHostName() = 0;
  };

  /// Null when no session can be opened.
  virtual std::unique_ptr<Session> open(const std::string& clientName) = 0;
};

}  // namespace tavisk
