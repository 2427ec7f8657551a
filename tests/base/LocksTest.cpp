// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <functional>
#include <thread>

#include "base/Locks.h"

namespace tavisk {
namespace {

/// Counts in several threads such that a count is lost where two are between `enter` and `leave` at once; the thread
/// sanitizer sees it too.
int countedByThreads(const std::function<void()>& enter, const std::function<void()>& leave) {
  int count = 0;
  const auto work = [&] {
    for (int times = 0; times < 1000; ++times) {
      enter();
      const auto seen = count;
      std::this_thread::yield();
      count = seen + 1;
      leave();
    }
  };
  std::thread one(work);
  std::thread other(work);
  one.join();
  other.join();
  return count;
}

TEST(ConditionLock, handsValuesOverInTurn) {
  enum : int { empty, full };
  ConditionLock lock(empty);
  int value = 0;  // guarded by the lock, which the thread sanitizer checks
  std::thread producer([&] {
    for (int next = 1; next <= 2000; ++next) {
      lock.lockWhenCondition(empty);
      value = next;
      lock.unlockWithCondition(full);
    }
  });
  for (int expected = 1; expected <= 2000; ++expected) {
    lock.lockWhenCondition(full);
    ASSERT_EQ(value, expected);
    lock.unlockWithCondition(empty);
  }
  producer.join();
}

TEST(ConditionLock, excludesWhateverTheCondition) {
  ConditionLock lock(3);
  EXPECT_EQ(countedByThreads([&] { lock.lock(); }, [&] { lock.unlock(); }), 2000);
  EXPECT_EQ(countedByThreads([&] { lock.lockWhenCondition(3); }, [&] { lock.unlock(); }), 2000);
}

TEST(ConditionLock, isUnlockedByAnyThread) {
  ConditionLock lock(3);
  lock.lock();
  std::thread([&] { lock.unlock(); }).join();
  lock.lockWhenCondition(3);  // the condition is as it was
}

TEST(PauseGate, takesPausesOneAfterTheOther) {
  PauseGate gate;
  EXPECT_EQ(countedByThreads([&] { gate.close(); }, [&] { gate.open(); }), 2000);
  gate.open();  // is always allowed
  gate.pass();
}

}  // namespace
}  // namespace tavisk
