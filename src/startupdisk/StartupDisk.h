// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

#include "startupdisk/SDController.h"
#include "startupdisk/SDEnvironment.h"

namespace tavisk {

/// The startup-disk code's state of one run.
class StartupDisk {
 public:
  /// Nothing that is given is owned.
  StartupDisk(Host& host, RunLoop& runLoop, NotificationCenter& notifications)
      : _environment(host, runLoop, notifications) {}

  /// The one controller, made at the first call.
  SDController& sharedController() {
    if (!_controller) _controller = std::make_unique<SDController>(_environment);
    return *_controller;
  }
  /// Null before that call.
  const SDController* madeController() const { return _controller.get(); }

 private:
  SDEnvironment _environment;
  std::unique_ptr<SDController> _controller;
};

}  // namespace tavisk
