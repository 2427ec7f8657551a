// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

namespace tavisk {

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

}  // namespace tavisk
