// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/SystemRoot.h"

namespace tavisk {

/// What on this machine sets another host name when it starts the next time, for people; empty when nothing is known.
std::string whoUndoesHostName(const SystemRoot& root, const std::string& name);

}  // namespace tavisk
