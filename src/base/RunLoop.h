// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>

namespace tavisk {

/// The process's one event loop. It is re-entrant: work that it runs may run it again.
///
/// A pass runs what was due when the pass began: posted work, timers, ready descriptors, in that order; what that work
/// posts is due in the next pass. Everything but `post` belongs to the thread that made the loop.
class RunLoop {
 public:
  using Clock = std::chrono::steady_clock;
  using Work = std::function<void()>;
  enum class Readiness {
    readable,
    priority
  };  ///< EPOLLIN; EPOLLPRI, with which the kernel tells of changed files in /proc and /sys

  /// Keeps a timer, a watched descriptor or a limit in force; its end takes it out. An empty one does nothing.
  class Registration {
   public:
    Registration() = default;
    explicit Registration(std::function<void()> cancel) : _cancel(std::move(cancel)) {}
    Registration(Registration&& other) noexcept;
    Registration& operator=(Registration&& other) noexcept;
    Registration(const Registration&) = delete;
    Registration& operator=(const Registration&) = delete;
    ~Registration();
    void cancel();

   private:
    std::function<void()> _cancel;
  };

  RunLoop();  ///< throws std::system_error when the kernel gives no descriptors
  ~RunLoop();
  RunLoop(const RunLoop&) = delete;
  RunLoop& operator=(const RunLoop&) = delete;

  /// Runs the work once, on the loop's thread, in the next pass. From any thread.
  void post(Work work);
  /// Runs the work once after the delay (never inside this call, also for a delay of 0).
  [[nodiscard]] Registration after(Clock::duration delay, Work work);
  /// Runs the work at every interval (above 0) until the registration ends.
  [[nodiscard]] Registration every(Clock::duration interval, Work work);
  /// Runs the work in each pass that finds the descriptor ready. The descriptor is not owned and must stay open as long
  /// as the registration. A regular file cannot be watched: the registration comes back empty.
  [[nodiscard]] Registration watch(int descriptor, Readiness readiness, Work work);

  /// Until the registration ends, all waits with a deadline have this much time together. A limit within another one
  /// does not widen it.
  [[nodiscard]] Registration limitWaits(Clock::duration together);
  /// Until the registration ends there is no limit, and the time does not count: the user is being asked something.
  [[nodiscard]] Registration pauseLimit();
  /// What the limit leaves of the time that a wait may take by itself; 0: it is to fail at once.
  Clock::duration timeFor(Clock::duration longest) const;

  /// One pass; never waits.
  void runPass();
  /// Passes until the deadline (or the end of a limit, here and below), waiting in between.
  void runUntil(Clock::time_point deadline);
  /// Passes until the condition holds (true) or the deadline has passed (false); the condition is asked before each
  /// wait.
  [[nodiscard]] bool runUntil(Clock::time_point deadline, const std::function<bool()>& condition);
  /// Passes until stop() is called.
  void run();
  /// Ends run() after the pass in which it is called.
  void stop();

 private:
  struct State;
  std::shared_ptr<State> _state;
};

}  // namespace tavisk
