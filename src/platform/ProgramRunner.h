// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "platform/Result.h"

namespace tavisk {

struct ProgramOutput {
  int exitStatus = 0;
  std::string text;  ///< standard output and standard error, as they came
};

class ProgramRunner {
 public:
  virtual ~ProgramRunner() = default;

  /// Runs the program (absolute path, no shell, a clean environment) and waits until it has ended. Fails when it cannot
  /// be started, does not end in time or is ended by a signal.
  virtual Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) = 0;
};

}  // namespace tavisk
