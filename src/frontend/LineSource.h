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

  /// Shows the prompt and reads one line as fgets does with a buffer of `room` bytes: at most room - 1 bytes, up to and
  /// including the newline; what follows a NUL byte in them is dropped. A longer line comes in pieces. Absent at the
  /// end of input or on an error; then a later call tries again.
  virtual std::optional<std::string> readLine(const std::string& prompt, std::size_t room) = 0;

  /// Gives the terminal back as it was found. Called by the thread that ends the run, also while a line is being read.
  virtual void restoreTerminal() = 0;
};

}  // namespace tavisk
