// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/linux/system/ProcessHandle.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/Processes.h"

namespace tavisk {

/// The descriptors of a started program; -1 where it gets none of ours.
struct ProgramFiles {
  int output = -1;  ///< its standard output and error, and no input; -1: it uses those of this process
  int third = -1;   ///< what it finds as descriptor 3
};

/// A program of the machine that was started, without a shell. One that still runs at the end of this object is killed.
class RunningProgram {
 public:
  /// `words` is its absolute path and its arguments. It gets an environment of its own (PATH and LC_ALL) and unblocked
  /// signals.
  static Result<RunningProgram> start(const SystemRoot& root, std::vector<std::string> words,
                                      const ProgramFiles& files);
  RunningProgram(RunningProgram&& other) noexcept;
  RunningProgram& operator=(RunningProgram&& other) noexcept;
  RunningProgram(const RunningProgram&) = delete;
  RunningProgram& operator=(const RunningProgram&) = delete;
  ~RunningProgram();

  bool endsBefore(RunLoop::Clock::time_point deadline, RunLoop& runLoop);
  /// As wait(2) gives it, after the end.
  int status() const { return _status; }

 private:
  explicit RunningProgram(ProcessId id) : _id(id) {}
  bool hasEnded();

  ProcessId _id;
  ProcessHandle _handle;
  int _status = 0;
  bool _hasEnded = false;
};

/// Runs one of the machine's programs to its end, without a shell: `words` is its absolute path and its arguments. It
/// gets an environment of its own (PATH and LC_ALL), no input, and unblocked signals. The run loop runs meanwhile.
/// Fails when it cannot be started, when it has not ended after 10 s (timed_out; it is killed; without that code where
/// no time was left to begin), and when its status is not 0: the reason is then the status and the last line that it
/// printed. On success the value is what it printed.
Result<std::string> runProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop);

/// As runProgram(), but any status is an answer; one that is ended by a signal fails.
Result<ProgramOutput> outputOfProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop);

}  // namespace tavisk
