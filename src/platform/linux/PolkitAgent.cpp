// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/PolkitAgent.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <chrono>

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestStart{3};

}  // namespace

PolkitAgent::PolkitAgent(const SystemRoot& root, RunLoop& runLoop) {
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC) != 0) return;
  const FileDescriptor readyEnd(ends[0]);
  FileDescriptor agentEnd(ends[1]);
  auto started =
      RunningProgram::start(root, {"/usr/bin/pkttyagent", "--notify-fd", "3", "--fallback"}, {-1, agentEnd.number()});
  if (!started) return;
  _agent = std::move(started).value();
  agentEnd = FileDescriptor();
  // It closes its end when it is ready.
  bool ready = false;
  auto watching = runLoop.watch(readyEnd.number(), RunLoop::Readiness::readable, [&ready] { ready = true; });
  static_cast<void>(runLoop.runUntil(RunLoop::Clock::now() + longestStart, [&ready] { return ready; }));
}

}  // namespace tavisk
