// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/StartupDisk.h"

namespace tavisk {

SDController& StartupDisk::sharedController() {
  if (!_controller) _controller = std::make_unique<SDController>(_environment);
  return *_controller;
}

}  // namespace tavisk
