// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/Program.h"

#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>

#include "platform/FileContents.h"
#include "platform/SystemFailure.h"
#include "platform/Text.h"
#include "platform/linux/RunningProgram.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestRun{10};
constexpr std::size_t outputLimit = 65536;

std::string lastLine(const std::string& text) {
  auto lines = split(text, "\r\n");
  return lines.empty() ? std::string() : ": " + lines.back();
}

std::string howItEnded(int status) {
  if (WIFSIGNALED(status)) return "it was ended by signal " + std::to_string(WTERMSIG(status));
  return "it ended with status " + std::to_string(WEXITSTATUS(status));
}

Failure outOfTime(const std::vector<std::string>& words) {
  return {"run", words.front(), "it has not ended in time"};
}

struct EndedProgram {
  int status;  ///< as wait(2) gives it
  std::string printed;
};

Result<EndedProgram> runToEnd(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  if (runLoop.timeFor(longestRun).count() == 0) return outOfTime(words);
  // A file in memory, not a pipe: a daemon that the program leaves behind may keep it open.
  const FileDescriptor output(::memfd_create("output", MFD_CLOEXEC));
  if (!output) return systemFailure("memfd_create", words.front(), errno);
  auto started = RunningProgram::start(root, words, {output.number()});
  if (!started) return started.failure();
  auto program = std::move(started).value();
  if (!program.endsBefore(RunLoop::Clock::now() + longestRun, runLoop)) return outOfTime(words);
  ::lseek(output.number(), 0, SEEK_SET);
  return EndedProgram{program.status(), readAll(output, outputLimit, words.front()).valueOr("")};
}

}  // namespace

Result<std::string> runProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  auto ended = runToEnd(root, words, runLoop);
  if (!ended) return ended.failure();
  if (ended->status != 0) return Failure{"run", words.front(), howItEnded(ended->status) + lastLine(ended->printed)};
  return ended->printed;
}

Result<ProgramOutput> outputOfProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  auto ended = runToEnd(root, words, runLoop);
  if (!ended) return ended.failure();
  if (WIFSIGNALED(ended->status)) return Failure{"run", words.front(), howItEnded(ended->status)};
  return ProgramOutput{WEXITSTATUS(ended->status), ended->printed};
}

}  // namespace tavisk
