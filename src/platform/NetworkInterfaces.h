// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace tavisk {

/// One address of a network interface; an interface with several addresses occurs several times.
struct InterfaceAddress {
  std::string interface;  ///< BSD name: "en0", "eth0"
  bool up = false;
  bool loopback = false;
  bool ipv4 = false;
};

class NetworkInterfaces {
 public:
  virtual ~NetworkInterfaces() = default;

  /// Absent when they cannot be listed.
  virtual std::optional<std::vector<InterfaceAddress>> addresses() = 0;
};

}  // namespace tavisk
