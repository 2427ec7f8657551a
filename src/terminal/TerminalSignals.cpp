// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalSignals.h"

#include <pthread.h>
#include <sys/signalfd.h>
#include <unistd.h>

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
  const sigset_t taken = setOf({SIGWINCH, SIGTSTP, SIGCONT});
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
  const sigset_t stop = setOf({SIGTSTP});
  ::kill(::getpid(), SIGTSTP);
  pthread_sigmask(SIG_UNBLOCK, &stop, nullptr);
  pthread_sigmask(SIG_BLOCK, &stop, nullptr);
}

}  // namespace tavisk
