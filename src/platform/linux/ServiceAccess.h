// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

#include "platform/RunLoop.h"
#include "platform/SystemRoot.h"
#include "platform/linux/Daemons.h"

namespace tavisk {

/// What this machine has to run its services, found out once, when it is first asked for.
class ServiceAccess {
 public:
  /// Both must outlive the object.
  ServiceAccess(const SystemRoot& root, RunLoop& runLoop) : _root(root), _runLoop(runLoop) {}

  Daemons& daemons();

 private:
  const SystemRoot& _root;
  RunLoop& _runLoop;
  std::unique_ptr<Daemons> _daemons;
};

}  // namespace tavisk
