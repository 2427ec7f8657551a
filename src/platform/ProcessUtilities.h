// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

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

  /// Whether the keyboard is disabled while the enclosure lock is engaged, from now on until the machine restarts.
  virtual void setLockEnclosureState(bool disablesKeyboard) = 0;
  /// Sets a preference of any application, for any user, on this host.
  virtual void setMachineBoolean(const std::string& key, bool value) = 0;
  /// Writes out what setMachineBoolean has set.
  virtual void writeMachinePreferences() = 0;
};

}  // namespace tavisk
