// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include "base/Process.h"
#include "base/Result.h"
#include "control/Run.h"

namespace tavisk::control {

/// Complains of the failure; gives back the status with which a command ends by it.
Status endBy(const Failure& failure, Status status, const Tools& tools);

/// Prints what a command has to say, and writes it out, which may take for ever: before its waiter for signals is gone.
/// Gives back the status.
Status endWith(const std::string& text, Status status, const Tools& tools);

/// From here on one of the signals ends the process as incomplete, after `end`, and nothing of its progress stays on
/// the terminal. Null when the system gives no thread: then it ends at once. `tools` are used until the waiter is gone.
std::unique_ptr<SignalWaiter> endBySignal(const EndingSignals& signals, SignalWaiter::End end, const Tools& tools);

}  // namespace tavisk::control
