// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalKeys.h"

#include <unistd.h>

#include <cerrno>

namespace tavisk {

std::optional<wchar_t> TerminalKeys::next(const TerminalSignals& signals) {
  while (true) {
    if (const std::optional<wchar_t> character = _typed.take()) return character;
    const std::optional<char> byte = nextByte(signals);
    if (!byte) return _typed.takeRest();
    _typed.add(*byte);
  }
}

std::optional<char> TerminalKeys::nextByte(const TerminalSignals& signals) {
  while (true) {
    waitForByte(signals);
    char byte = 0;
    const ssize_t count = ::read(STDIN_FILENO, &byte, 1);
    if (count == 1) return byte;
    if (count == 0 || (errno != EINTR && errno != EAGAIN)) return std::nullopt;
  }
}

void TerminalKeys::waitForByte(const TerminalSignals& signals) {
  bool isReadable = false;
  const auto typed = _runLoop.watch(STDIN_FILENO, RunLoop::Readiness::readable, [&] { isReadable = true; });
  const auto happened = _runLoop.watch(signals.descriptor(), RunLoop::Readiness::readable, [&] {
    while (const std::optional<int> signal = signals.take()) _onSignal(*signal);
  });
  (void)_runLoop.runUntil(RunLoop::Clock::time_point::max(), [&] { return isReadable; });
}

}  // namespace tavisk
