// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Locks.h"

#include <chrono>
#include <thread>

namespace tavisk {

std::unique_lock<std::mutex> lockSoon(std::mutex& mutex) {
  // Not a timed mutex: the thread sanitizer of gcc 12 does not know how that one waits.
  constexpr int attempts = 50;
  std::unique_lock lock(mutex, std::try_to_lock);
  for (int attempt = 0; !lock && attempt < attempts; ++attempt) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
    static_cast<void>(lock.try_lock());
  }
  return lock;
}

void ConditionLock::lock() {
  std::unique_lock guard(_mutex);
  _changed.wait(guard, [this] { return !_locked; });
  _locked = true;
}

void ConditionLock::lockWhenCondition(int condition) {
  std::unique_lock guard(_mutex);
  _changed.wait(guard, [this, condition] { return !_locked && _condition == condition; });
  _locked = true;
}

void ConditionLock::unlock() {
  const std::scoped_lock guard(_mutex);
  _locked = false;
  _changed.notify_all();
}

void ConditionLock::unlockWithCondition(int condition) {
  const std::scoped_lock guard(_mutex);
  _condition = condition;
  _locked = false;
  _changed.notify_all();
}

void PauseGate::close() {
  std::unique_lock guard(_mutex);
  _opened.wait(guard, [this] { return !_closed; });
  _closed = true;
}

void PauseGate::open() {
  const std::scoped_lock guard(_mutex);
  _closed = false;
  _opened.notify_all();
}

void PauseGate::pass() {
  std::unique_lock guard(_mutex);
  _opened.wait(guard, [this] { return !_closed; });
}

}  // namespace tavisk
