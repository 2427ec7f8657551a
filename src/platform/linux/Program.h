// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "platform/ProgramRunner.h"
#include "platform/Result.h"
#include "platform/RunLoop.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// Runs one of the machine's programs to its end, without a shell: `words` is its absolute path and its arguments. It
/// gets an environment of its own (PATH and LC_ALL), no input, and unblocked signals. The run loop runs meanwhile.
/// Fails when it cannot be started, when it has not ended after 10 s (it is killed), and when its status is not 0: the
/// reason is then the status and the last line that it printed. On success the value is what it printed.
Result<std::string> runProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop);

/// As runProgram(), but any status is an answer; one that is ended by a signal fails.
Result<ProgramOutput> outputOfProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop);

}  // namespace tavisk
