// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

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

}  // namespace tavisk
