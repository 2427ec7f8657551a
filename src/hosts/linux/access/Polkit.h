// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/system/Program.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// polkit's answer about an action.
struct Authorization {
  bool isGranted;
  std::string temporaryId;  ///< empty when nothing has to be given back
};

/// Asks polkit whether this process may do an action; at a terminal it may ask the user to authenticate. Fails with
/// serviceUnknown where polkit is not installed.
Result<Authorization> checkAuthorization(Bus& bus, const char* action);

/// Gives a temporary authorization back.
Result<void> revokeAuthorization(Bus& bus, const std::string& temporaryId);

/// Asks the user for passwords at the terminal on behalf of polkit (pkttyagent(1)), as long as this object exists.
class PolkitAgent {
 public:
  /// Returns when the agent is ready, after a few seconds at most; a machine that has none goes without.
  PolkitAgent(const SystemRoot& root, RunLoop& runLoop);

 private:
  std::optional<RunningProgram> _agent;
};

}  // namespace tavisk
