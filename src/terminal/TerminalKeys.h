// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <csignal>
#include <functional>
#include <optional>

#include "base/FileDescriptor.h"
#include "base/RunLoop.h"
#include "terminal/WideText.h"

namespace tavisk {

/// While it lives, what happens to the terminal waits to be taken instead of being acted upon: SIGWINCH (its size has
/// changed), SIGTSTP (Ctrl-Z) and SIGCONT. Other threads must have them blocked.
class TerminalSignals final {
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

/// The keys of the terminal on standard input, as characters. While it waits for one, the run loop runs.
class TerminalKeys final {
 public:
  /// `onSignal` is told of the terminal's signals while next() waits.
  TerminalKeys(RunLoop& runLoop, std::function<void(int signal)> onSignal)
      : _runLoop(runLoop), _onSignal(std::move(onSignal)) {}

  /// Absent at the end of input.
  std::optional<wchar_t> next(const TerminalSignals& signals);
  /// Whether more is there already: then it was hardly typed by hand.
  static bool isMoreWaiting();

 private:
  std::optional<char> nextByte(const TerminalSignals& signals);
  void waitForByte(const TerminalSignals& signals);

  RunLoop& _runLoop;
  std::function<void(int)> _onSignal;
  TypedText _typed;
};

}  // namespace tavisk
