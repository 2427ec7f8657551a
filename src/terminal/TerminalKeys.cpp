// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalKeys.h"

#include <pthread.h>
#include <sys/ioctl.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <cerrno>
#include <initializer_list>

namespace tavisk {
namespace {

sigset_t setOf(std::initializer_list<int> signals) {
  sigset_t set;
  sigemptyset(&set);
  for (const int signal : signals) sigaddset(&set, signal);
  return set;
}

}  // namespace

TerminalSignals::TerminalSignals() : _before() {
  const auto taken = setOf({SIGWINCH, SIGTSTP, SIGCONT});
  _descriptor = FileDescriptor(::signalfd(-1, &taken, SFD_CLOEXEC | SFD_NONBLOCK));
  pthread_sigmask(SIG_BLOCK, &taken, &_before);
}

TerminalSignals::~TerminalSignals() {
  pthread_sigmask(SIG_SETMASK, &_before, nullptr);
}

std::optional<int> TerminalSignals::take() const {
  signalfd_siginfo signal{};
  if (::read(_descriptor.number(), &signal, sizeof signal) != sizeof signal) return std::nullopt;
  return static_cast<int>(signal.ssi_signo);
}

void TerminalSignals::stop() const {
  const auto stop = setOf({SIGTSTP});
  ::kill(::getpid(), SIGTSTP);
  pthread_sigmask(SIG_UNBLOCK, &stop, nullptr);
  pthread_sigmask(SIG_BLOCK, &stop, nullptr);
}

std::optional<wchar_t> TerminalKeys::next(const TerminalSignals& signals) {
  while (true) {
    if (const auto character = _typed.take()) return character;
    const auto byte = nextByte(signals);
    if (!byte) return _typed.takeRest();
    _typed.add(*byte);
  }
}

bool TerminalKeys::isMoreWaiting() {
  int count = 0;
  return ::ioctl(STDIN_FILENO, FIONREAD, &count) == 0 && count > 0;
}

std::optional<char> TerminalKeys::nextByte(const TerminalSignals& signals) {
  while (true) {
    waitForByte(signals);
    char byte = 0;
    const auto count = ::read(STDIN_FILENO, &byte, 1);
    if (count == 1) return byte;
    if (count == 0 || (errno != EINTR && errno != EAGAIN)) return std::nullopt;
  }
}

void TerminalKeys::waitForByte(const TerminalSignals& signals) {
  bool isReadable = false;
  const auto typed = _runLoop.watch(STDIN_FILENO, RunLoop::Readiness::readable, [&] { isReadable = true; });
  const auto happened = _runLoop.watch(signals.descriptor(), RunLoop::Readiness::readable, [&] {
    while (const auto signal = signals.take()) _onSignal(*signal);
  });
  static_cast<void>(_runLoop.runUntil(RunLoop::Clock::time_point::max(), [&] { return isReadable; }));
}

}  // namespace tavisk
