// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdint>
#include <mutex>
#include <string>

#include "base/FileDescriptor.h"
#include "hosts/linux/BusPeer.h"

namespace tavisk {

/// The message bus of a machine that is a tree of files, with its login service and its service manager. The login
/// service goes by what the tree's configuration says at the moment when it reads it.
class FakePowerServices {
 public:
  explicit FakePowerServices(const std::filesystem::path& tree);

  /// After what time the machine would really sleep. The timer is set when the service starts, not later; it is then
  /// "at once" as nobody has been logged in for long, unless somebody holds a lock against idleness.
  std::string sleepsAfter();
  /// The service manager forgets what was set, and goes by its configuration.
  void startAgain();

  std::atomic<const char*> canSuspend = "yes";
  std::atomic<const char*> sleepTarget = "loaded";

 private:
  int answer(sd_bus_message* call, const std::string& member);
  int answerGet(sd_bus_message* call);
  int answerSet(sd_bus_message* call);
  int answerInhibit(sd_bus_message* call);
  int answerRestart(sd_bus_message* call);
  bool isHeldBusy() const;
  void readLogin();
  void readManager();

  std::filesystem::path _tree;
  std::mutex _mutex;
  std::string _idleAction = "ignore";
  std::string _idleMinutes = "30";
  std::string _powerKey = "poweroff";
  std::string _sleepsAfter = "never";
  std::uint64_t _watchdogSet = 0;  ///< 0: goes by what was read
  std::uint64_t _watchdogRead = 0;
  FileDescriptor _lock;
  BusPeer _peer;  ///< the last: its thread works with the others
};

}  // namespace tavisk
