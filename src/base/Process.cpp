// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Process.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <new>
#include <string_view>
#include <system_error>
#include <thread>
#include <utility>

namespace tavisk {
namespace {

constexpr timespec endTakesAtMost{.tv_sec = 0, .tv_nsec = 80'000'000};

bool openMissingDescriptors() {
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(descriptor, F_GETFD) < 0 && open("/dev/null", O_RDONLY) != descriptor) return false;
  }
  return true;
}

bool isKept(std::string_view variable) {
  constexpr std::array kept = {"LANG=", "TERM=", "NO_COLOR=", "SUDO_UID=", "TAVISK_", "LC_"};
  return std::ranges::any_of(kept, [&](const char* start) { return variable.starts_with(start); });
}

void keepKnownVariables() {
  if (!environ) return;
  char** end = environ;
  for (char** variable = environ; *variable; ++variable) {
    if (isKept(*variable)) *end++ = *variable;
  }
  *end = nullptr;
}

[[noreturn]] void sleepForGood() {
  while (true) pause();
}

}  // namespace

bool prepareProcess() {
  static_cast<void>(std::signal(SIGPIPE, SIG_IGN));
  static_cast<void>(std::signal(SIGXFSZ, SIG_IGN));
  keepKnownVariables();
  static_cast<void>(close_range(STDERR_FILENO + 1, ~0U, CLOSE_RANGE_CLOEXEC));
  return openMissingDescriptors();
}

std::string newRunName() {
  timespec now{};
  clock_gettime(CLOCK_REALTIME, &now);
  return std::to_string(getpid()) + "-" + std::to_string(now.tv_sec) + "." + std::to_string(now.tv_nsec);
}

void complain(std::string_view text) {
  static_cast<void>(std::fprintf(stderr, "tavisk: %.*s\n", static_cast<int>(text.size()), text.data()));
}

std::string_view reasonOf(const std::exception& error) {
  return dynamic_cast<const std::bad_alloc*>(&error) ? "out of memory" : error.what();
}

EndingSignals::EndingSignals() : _set() {
  sigemptyset(&_set);
  sigaddset(&_set, SIGINT);
  sigaddset(&_set, SIGTERM);
  struct sigaction hangUp {};
  if (sigaction(SIGHUP, nullptr, &hangUp) != 0 || hangUp.sa_handler != SIG_IGN) sigaddset(&_set, SIGHUP);
  pthread_sigmask(SIG_BLOCK, &_set, nullptr);
}

void EndingSignals::unblock() const {
  pthread_sigmask(SIG_UNBLOCK, &_set, nullptr);
}

std::unique_ptr<SignalWaiter> SignalWaiter::start(const EndingSignals& signals, End end, Status status) {
  const auto run = std::make_shared<Run>();
  run->end = std::move(end);
  run->status = std::move(status);
  try {
    std::thread([run, set = signals.set()] { wait(set, *run); }).detach();
  } catch (const std::system_error&) {
    return nullptr;
  }
  return std::unique_ptr<SignalWaiter>(new SignalWaiter(run));
}

SignalWaiter::~SignalWaiter() {
  if (_run->isOver.exchange(true)) sleepForGood();
}

void SignalWaiter::wait(const sigset_t& signals, Run& run) {
  sigset_t all;
  sigfillset(&all);
  pthread_sigmask(SIG_BLOCK, &all, nullptr);
  int signal = 0;
  sigwait(&signals, &signal);
  if (!run.isOver.exchange(true)) endProcess(std::string("SIG") + sigabbrev_np(signal), run);
}

void SignalWaiter::endProcess(const std::string& signal, const Run& run) {
  const auto end = [&run, signal] {
    doStep([&] { run.end(signal); });
    _exit(run.status());
  };
  try {
    std::thread(end).detach();
  } catch (const std::exception&) {
    end();
  }
  // Every signal is blocked in this thread: it sleeps for all of the time.
  nanosleep(&endTakesAtMost, nullptr);
  _exit(run.status());
}

}  // namespace tavisk
