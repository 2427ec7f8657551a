// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <csignal>
#include <optional>

#include "base/FileDescriptor.h"

namespace tavisk {

/// While it lives, what happens to the terminal waits to be taken instead of being acted upon: SIGWINCH (its size has
/// changed), SIGTSTP (Ctrl-Z) and SIGCONT. Other threads must have them blocked.
class TerminalSignals {
 public:
  TerminalSignals();
  ~TerminalSignals();
  TerminalSignals(const TerminalSignals&) = delete;
  TerminalSignals& operator=(const TerminalSignals&) = delete;

  /// Readable when there is one; negative when the system gives no descriptor: then there is none.
  int descriptor() const { return _descriptor.number(); }
  /// Absent when none waits.
  std::optional<int> take() const;
  /// Does what SIGTSTP does where nobody takes it. Returns when the process goes on.
  void stop() const;

 private:
  sigset_t _before;
  FileDescriptor _descriptor;
};

}  // namespace tavisk
