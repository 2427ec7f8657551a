// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <sched.h>
#include <sys/mount.h>

#include <functional>
#include <thread>

namespace tavisk {

/// Runs the work on a thread whose mounts nobody else sees; they go with it. False, and nothing is run, where the tests
/// may not do that.
inline bool withOwnMounts(const std::function<void()>& work) {
  bool allowed = false;
  std::thread([&] {
    allowed = ::unshare(CLONE_FS | CLONE_NEWNS) == 0 && ::mount("", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
    if (allowed) work();
  }).join();
  return allowed;
}

/// An empty file system in memory of `size`, such as "64k".
inline bool mountMemory(const std::string& folder, const std::string& size) {
  return ::mount("tavisk-test", folder.c_str(), "tmpfs", 0, ("size=" + size).c_str()) == 0;
}

}  // namespace tavisk
