// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdio>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "frontend/Output.h"

namespace tavisk {

/// Where typed lines come from: a stream, or the line editor of a terminal.
class LineSource {
 public:
  /// The words that can stand instead of the last word of a text, which ends at the cursor: after its last space, maybe
  /// empty. A word that ends with "/" is the beginning of several more.
  using Completions = std::function<std::vector<std::string>(const std::string& text)>;

  virtual ~LineSource() = default;

  /// Shows the prompt and reads one line as fgets does with a buffer of `room` bytes: at most room - 1 bytes, up to and
  /// including the newline; what follows a NUL byte in them is dropped. A longer line comes in pieces. Absent at the
  /// end of input or on an error; then a later call tries again.
  virtual std::optional<std::string> readLine(const std::string& prompt, std::size_t room) = 0;

  /// As readLine, for a line of commands: a line editor helps to type it, and remembers it for the next one.
  virtual std::optional<std::string> readCommandLine(const std::string& prompt, std::size_t room,
                                                     const Completions& /*completions*/) {
    return readLine(prompt, room);
  }

  /// Gives the terminal back as it was found. Called by the thread that ends the run, also while a line is being read.
  virtual void restoreTerminal() = 0;
};

/// Lines from a stream, as they come; the prompt goes to the output.
class StreamLineSource final : public LineSource {
 public:
  /// Neither is owned.
  StreamLineSource(std::FILE* stream, Output& output) : _stream(stream), _output(output) {}

  std::optional<std::string> readLine(const std::string& prompt, std::size_t room) override;
  void restoreTerminal() override {}

 private:
  std::FILE* _stream;
  Output& _output;
};

}  // namespace tavisk
