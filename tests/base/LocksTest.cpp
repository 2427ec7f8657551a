// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "base/Locks.h"

namespace tavisk {
namespace {

/// Long enough for a thread that is not held back to get on.
void giveOthersTime() {
  std::this_thread::sleep_for(std::chrono::milliseconds(20));
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
  std::atomic<bool> isInside = false;
  lock.lock();
  std::thread other([&] {
    lock.lockWhenCondition(3);
    isInside = true;
    lock.unlock();
  });
  giveOthersTime();
  EXPECT_FALSE(isInside);
  lock.unlock();
  other.join();
  EXPECT_TRUE(isInside);
  lock.lockWhenCondition(3);  // the condition is as it was
  std::thread([&] { lock.unlock(); }).join();
  lock.lock();  // another thread has unlocked it
}

TEST(PauseGate, takesPausesOneAfterTheOther) {
  PauseGate gate;
  gate.close();
  std::atomic<bool> isClosedAgain = false;
  std::thread second([&] {
    gate.close();
    isClosedAgain = true;
    gate.open();
  });
  giveOthersTime();
  EXPECT_FALSE(isClosedAgain);
  gate.open();
  second.join();
  gate.pass();
}

}  // namespace
}  // namespace tavisk
