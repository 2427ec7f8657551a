// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <utility>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "platform/Processes.h"

namespace tavisk {

/// Stands for one process, also when its id has become another's (pidfd_open(2)).
class ProcessHandle {
 public:
  /// For no process.
  ProcessHandle() = default;
  /// Fails with ESRCH when there is no such process.
  static Result<ProcessHandle> of(ProcessId process);

  /// `signal` is a number of signal(7).
  Result<void> send(int signal) const;
  /// Readable when the process has ended.
  int descriptor() const { return _file.number(); }

 private:
  ProcessHandle(ProcessId process, FileDescriptor file) : _process(process), _file(std::move(file)) {}

  ProcessId _process = 0;
  FileDescriptor _file;
};

}  // namespace tavisk
