// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <mutex>

namespace tavisk {

/// Takes the mutex, but gives up after 50 ms or a little more: its holder may be stuck for good.
std::unique_lock<std::mutex> lockSoon(std::mutex& mutex);

/// A lock that carries an integer condition: a thread may wait for the lock until the condition has a value.
/// Any thread may unlock it.
class ConditionLock {
 public:
  explicit ConditionLock(int condition) : _condition(condition) {}
  void lock();
  /// Waits until the lock is free and the condition equals the value, then takes it.
  void lockWhenCondition(int condition);
  /// Leaves the condition as it is.
  void unlock();
  void unlockWithCondition(int condition);

 private:
  std::mutex _mutex;
  std::condition_variable _changed;
  int _condition;
  bool _locked = false;
};

/// Closed while something is paused; who passes waits until it is open. Opening is always allowed, from any thread.
class PauseGate {
 public:
  /// Waits while the gate is already closed: pauses come in pairs with their ends.
  void close();
  void open();
  void pass();

 private:
  std::mutex _mutex;
  std::condition_variable _opened;
  bool _closed = false;
};

}  // namespace tavisk
