// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

namespace tavisk {

class KeyboardInputService {
 public:
  virtual ~KeyboardInputService() = default;

  /// The layout number of the current keyboard input source; absent when there is no source or it has no number.
  virtual std::optional<std::int64_t> currentLayoutNumber() = 0;
};

}  // namespace tavisk
