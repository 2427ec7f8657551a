// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

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

}  // namespace tavisk
