// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/Result.h"
#include "platform/linux/Bus.h"

namespace tavisk {

/// polkit's answer about an action.
struct Authorization {
  bool granted;
  std::string temporaryId;  ///< empty when nothing has to be given back
};

/// Asks polkit whether this process may do an action; at a terminal it may ask the user to authenticate. Fails with
/// serviceUnknown where polkit is not installed.
Result<Authorization> checkAuthorization(Bus& bus, const char* action);

/// Gives a temporary authorization back.
Result<void> revokeAuthorization(Bus& bus, const std::string& temporaryId);

}  // namespace tavisk
