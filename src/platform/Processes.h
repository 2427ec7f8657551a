// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "base/Result.h"

namespace tavisk {

using ProcessId = std::int32_t;

/// Processes, and what else is the same for all users of the machine. Results of the operations go to the effects.
class ProcessUtilities {
 public:
  virtual ~ProcessUtilities() = default;

  /// Of a running process with that name; 0 when there is none.
  virtual ProcessId processNamed(const std::string& name) = 0;
  /// `signal` is a number of signal(7).
  virtual void sendSignal(int signal, ProcessId process) = 0;

  /// Whether the keyboard is disabled while the enclosure lock is engaged, from now on until the machine restarts. A
  /// host may wait with it for writeMachinePreferences().
  virtual void setLockEnclosureState(bool disablesKeyboard) = 0;
  /// Sets a preference of any application, for any user, on this host.
  virtual void setMachineBoolean(const std::string& key, bool value) = 0;
  /// Writes out what setMachineBoolean has set.
  virtual void writeMachinePreferences() = 0;
};

/// Whether the host may end this process without notice, as it does when the machine is shut down.
class ProcessTermination {
 public:
  virtual ~ProcessTermination() = default;

  /// Asks the host to wait. A host that cannot is free to go on.
  virtual void disable() = 0;
  virtual void enable() = 0;
};

/// Keeps the host waiting as long as it lives.
class TerminationHold {
 public:
  explicit TerminationHold(ProcessTermination& termination) : _termination(termination) { _termination.disable(); }
  ~TerminationHold() { _termination.enable(); }
  TerminationHold(const TerminationHold&) = delete;
  TerminationHold& operator=(const TerminationHold&) = delete;

 private:
  ProcessTermination& _termination;
};

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
