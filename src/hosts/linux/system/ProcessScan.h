// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "hosts/shared/SystemRoot.h"
#include "platform/Processes.h"

namespace tavisk {

/// The processes that run a program of this name, in no particular order: this machine's own, without those of
/// containers, without kernel threads, processes that have ended, and the caller itself. Empty also when /proc is
/// missing or hides them (proc(5), hidepid).
Result<std::vector<ProcessId>> processesNamed(const SystemRoot& root, const std::string& name);

}  // namespace tavisk
