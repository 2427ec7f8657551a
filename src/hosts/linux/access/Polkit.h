// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <utility>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/linux/services/Bus.h"
#include "hosts/linux/system/Program.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// polkit's answer about an action.
struct Authorization {
  bool isGranted;
  bool isForTheAsking;      ///< not granted: the user would have to authenticate first
  bool wasAsked;            ///< not granted: the user was asked to authenticate
  std::string temporaryId;  ///< empty when nothing has to be given back
};

/// Makes the user ready to be asked to authenticate: success means that a question will be shown.
using Asker = std::function<Result<void>()>;

/// Asks polkit whether this process may do an action. Where the user has to authenticate first, polkit asks as soon as
/// `asker` has made that possible; an empty one: the user is not asked. Fails with serviceUnknown where polkit is not
/// installed.
Result<Authorization> checkAuthorization(Bus& bus, const char* action, const Asker& asker);

/// Gives a temporary authorization back.
Result<void> revokeAuthorization(Bus& bus, const std::string& temporaryId);

/// Asks the user for passwords at the terminal on behalf of polkit (pkttyagent(1)), as long as this object exists.
class PolkitAgent {
 public:
  /// Returns when polkit knows the agent and will ask through it. Fails when that is not so after a few seconds.
  static Result<PolkitAgent> start(const SystemRoot& root, RunLoop& runLoop);

 private:
  explicit PolkitAgent(RunningProgram program) : _program(std::move(program)) {}

  RunningProgram _program;
};

}  // namespace tavisk
