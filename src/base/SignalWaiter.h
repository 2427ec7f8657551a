// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <csignal>
#include <functional>
#include <memory>
#include <string>
#include <thread>

namespace tavisk {

/// The signals that end a run: INT, TERM, and HUP unless the run was started with it ignored, as nohup(1) does.
/// Making one blocks them in this thread and in all threads that it starts from then on.
class EndingSignals {
 public:
  EndingSignals();
  /// Lets the signals end the process as the system does it.
  void unblock() const;
  const sigset_t& set() const { return _set; }

 private:
  sigset_t _set;
};

/// A thread that waits for the ending signals and then ends the process within 100 ms, wherever the other threads are:
/// what takes longer is left undone, and a second signal ends it at once.
class SignalWaiter {
 public:
  /// What is done before the end, given the name of the signal ("SIGTERM"). Called in a thread of its own.
  using End = std::function<void(const std::string& signal)>;
  /// The exit status as it stands. Must not wait for anything.
  using Status = std::function<int()>;

  /// Null when the system gives no thread.
  static std::unique_ptr<SignalWaiter> start(const EndingSignals& signals, End end, Status status);
  /// Ends the thread. Does not return when a signal is ending the process already.
  ~SignalWaiter();
  SignalWaiter(const SignalWaiter&) = delete;
  SignalWaiter& operator=(const SignalWaiter&) = delete;

 private:
  enum class State { waiting, stopped, ending };

  SignalWaiter(const EndingSignals& signals, End end, Status status);
  void wait();
  [[noreturn]] void endProcess(const std::string& signal);

  const sigset_t _signals;
  const End _end;
  const Status _status;
  std::atomic<State> _state = State::waiting;
  std::thread _thread;
};

}  // namespace tavisk
