// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"

namespace tavisk {

/// What the kernel says of the machine.
class KernelValues {
 public:
  virtual ~KernelValues() = default;

  /// The machine's model, at most 127 bytes; empty when it is not known.
  virtual std::string model() = 0;
  /// 0 in its low byte is a machine of the old kind.
  virtual std::int32_t epoch() = 0;
  /// Non-zero when the machine was started from the network.
  virtual std::int32_t networkStart() = 0;
};

class KeyboardInputService {
 public:
  virtual ~KeyboardInputService() = default;

  /// The layout number of the current keyboard input source; absent when there is no source or it has no number.
  virtual Result<std::optional<std::int64_t>> currentLayoutNumber() = 0;
};

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
