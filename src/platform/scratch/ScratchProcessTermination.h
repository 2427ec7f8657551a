// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ProcessTermination.h"

namespace tavisk {

/// A machine that never shuts down.
class ScratchProcessTermination final : public ProcessTermination {
 public:
  void disable() override {}
  void enable() override {}
};

}  // namespace tavisk
