// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string>

namespace tavisk {

/// Where typed lines come from: a stream, or the line editor of a terminal.
class LineSource {
 public:
  virtual ~LineSource() = default;

  /// Shows the prompt (already printed by the caller for a stream) and reads one line as fgets does with a buffer of
  /// `room` bytes: at most room - 1 bytes, up to and including the newline, ending at the first NUL byte. A longer line
  /// comes in pieces. Absent at the end of input or on an error.
  virtual std::optional<std::string> readLine(std::size_t room) = 0;
};

}  // namespace tavisk
