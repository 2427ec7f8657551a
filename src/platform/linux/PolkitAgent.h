// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include "platform/RunLoop.h"
#include "platform/SystemRoot.h"
#include "platform/linux/RunningProgram.h"

namespace tavisk {

/// Asks for passwords at the terminal on behalf of polkit (pkttyagent(1)), as long as this object exists.
class PolkitAgent {
 public:
  /// Returns when the agent is ready, after a few seconds at most; a machine that has none goes without.
  PolkitAgent(const SystemRoot& root, RunLoop& runLoop);

 private:
  std::optional<RunningProgram> _agent;
};

}  // namespace tavisk
