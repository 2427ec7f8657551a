// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>

#include "base/RunLoop.h"
#include "terminal/TerminalSignals.h"
#include "terminal/WideText.h"

namespace tavisk {

/// The keys of the terminal on standard input, as characters. While it waits for one, the run loop runs.
class TerminalKeys {
 public:
  /// `onSignal` is told of the terminal's signals while next() waits.
  TerminalKeys(RunLoop& runLoop, std::function<void(int signal)> onSignal)
      : _runLoop(runLoop), _onSignal(std::move(onSignal)) {}

  /// Absent at the end of input.
  std::optional<wchar_t> next(const TerminalSignals& signals);

 private:
  std::optional<char> nextByte(const TerminalSignals& signals);
  void waitForByte(const TerminalSignals& signals);

  RunLoop& _runLoop;
  std::function<void(int)> _onSignal;
  TypedText _typed;
};

}  // namespace tavisk
