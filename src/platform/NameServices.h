// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

namespace tavisk {

/// The machine's configured names. Results go to the effects, not to the caller.
class HostConfigService {
 public:
  virtual ~HostConfigService() = default;

  /// The friendly name that users are shown: any text, also the empty one.
  virtual void setComputerName(const std::string& name) = 0;
  /// The name announced on the local network, a DNS name.
  virtual void setLocalNetworkName(const std::string& name) = 0;
};

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
