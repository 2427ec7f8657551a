// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <csignal>
#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

namespace tavisk {

/// What the tool needs of the process before anything else; call it first, from the only thread. False when the process
/// cannot be used at all: no standard descriptors and no /dev/null.
///
/// Standard descriptors that are closed are opened such that reads find the end and writes fail: no other file can take
/// their place. All others are closed in programs that this one starts. Writing to a closed pipe or beyond the size
/// limit becomes an error. Of the environment, only TAVISK_*, LANG, LC_*, TERM, NO_COLOR and SUDO_UID are kept.
bool prepareProcess();

/// What tells this run apart from all others on this machine: the process id and the time of the call.
std::string newRunName();

/// One line on standard error: "tavisk: TEXT". Asks for no memory.
void complain(std::string_view text);

/// What people are told of an exception, in one piece with the object: "out of memory".
std::string_view reasonOf(const std::exception& error);

/// Does one step of the end of a run, whose other steps are done also when this one throws.
template <typename Step>
void doStep(const Step& step) noexcept {
  try {
    step();
  } catch (const std::exception&) {
    // What cannot be done any more is left undone.
  }
}

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
/// what takes longer is left undone. Further signals change nothing. One a process: when it is not needed any more, its
/// thread is left alone, which costs less than to wait for it, and still takes signals away from others.
class SignalWaiter {
 public:
  /// What is done before the end, given the name of the signal ("SIGTERM"). Called in a thread of its own.
  using End = std::function<void(const std::string& signal)>;
  /// The exit status as it stands. Must not wait for anything.
  using Status = std::function<int()>;

  /// Null when the system gives no thread.
  static std::unique_ptr<SignalWaiter> start(const EndingSignals& signals, End end, Status status);
  /// From here on signals do nothing. Does not return when one is ending the process already.
  ~SignalWaiter();
  SignalWaiter(const SignalWaiter&) = delete;
  SignalWaiter& operator=(const SignalWaiter&) = delete;

 private:
  /// What the thread knows, which may outlive the waiter.
  struct Run {
    End end;
    Status status;
    std::atomic<bool> isOver = false;  ///< or is being ended
  };

  explicit SignalWaiter(std::shared_ptr<Run> run) : _run(std::move(run)) {}
  static void wait(const sigset_t& signals, Run& run);
  [[noreturn]] static void endProcess(const std::string& signal, const Run& run);

  const std::shared_ptr<Run> _run;
};

}  // namespace tavisk
