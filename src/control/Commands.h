// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "control/CommandLine.h"
#include "control/Run.h"

namespace tavisk::control {

/// The commands, each as its row tells: they complain of what they cannot do, and say how they ended.
Status showStatus(const Invocation& invocation, const Tools& tools);
Status rehearseChanges(const Invocation& invocation, const Tools& tools);
Status applySettings(const Invocation& invocation, const Tools& tools);
Status undoChanges(const Invocation& invocation, const Tools& tools);
Status resetSettings(const Invocation& invocation, const Tools& tools);

}  // namespace tavisk::control
