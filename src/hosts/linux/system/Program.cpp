// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/Program.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <utility>

#include "base/FileDescriptor.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestRun{10};
constexpr std::size_t outputLimit = 65536;

/// The attributes and file actions of posix_spawn(3).
class SpawnSetup {
 public:
  explicit SpawnSetup(const ProgramFiles& files) {
    ::posix_spawnattr_init(&_attributes);
    ::posix_spawn_file_actions_init(&_actions);
    resetSignals();
    if (files.output >= 0) {
      ::posix_spawn_file_actions_addopen(&_actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
      ::posix_spawn_file_actions_adddup2(&_actions, files.output, STDOUT_FILENO);
      ::posix_spawn_file_actions_adddup2(&_actions, files.output, STDERR_FILENO);
    }
    if (files.third >= 0) ::posix_spawn_file_actions_adddup2(&_actions, files.third, 3);
  }
  SpawnSetup(const SpawnSetup&) = delete;
  SpawnSetup& operator=(const SpawnSetup&) = delete;
  ~SpawnSetup() {
    ::posix_spawn_file_actions_destroy(&_actions);
    ::posix_spawnattr_destroy(&_attributes);
  }
  const posix_spawnattr_t* attributes() const { return &_attributes; }
  const posix_spawn_file_actions_t* actions() const { return &_actions; }

 private:
  void resetSignals() {
    sigset_t signals;
    ::sigemptyset(&signals);
    ::posix_spawnattr_setsigmask(&_attributes, &signals);
    ::sigfillset(&signals);
    ::posix_spawnattr_setsigdefault(&_attributes, &signals);
    ::posix_spawnattr_setflags(&_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  }

  posix_spawnattr_t _attributes{};
  posix_spawn_file_actions_t _actions{};
};

std::vector<char*> pointersTo(std::vector<std::string>& words) {
  std::vector<char*> pointers;
  pointers.reserve(words.size() + 1);
  for (auto& word : words) pointers.push_back(word.data());
  pointers.push_back(nullptr);
  return pointers;
}

/// ": LINE"; empty when there is none.
std::string lastLine(const std::string& text) {
  const auto lines = split(text, "\r\n");
  return lines.empty() ? std::string() : ": " + lines.back();
}

std::string howItEnded(int status) {
  if (WIFSIGNALED(status)) return "it was ended by signal " + std::to_string(WTERMSIG(status));
  return "it ended with status " + std::to_string(WEXITSTATUS(status));
}

Failure outOfTime(const std::vector<std::string>& words) {
  return {"run", words.front(), "it has not ended in time", std::make_error_code(std::errc::timed_out)};
}

struct EndedProgram {
  int status;  ///< as wait(2) gives it
  std::string printed;
};

Result<EndedProgram> runToEnd(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  if (runLoop.timeFor(longestRun).count() == 0) return Failure{"run", words.front(), "timed out before it was begun"};
  // A file in memory, not a pipe: a daemon that the program leaves behind may keep it open.
  const FileDescriptor output(::memfd_create("output", MFD_CLOEXEC));
  if (!output) return systemFailure("memfd_create", words.front(), errno);
  auto started = RunningProgram::start(root, words, {output.number()});
  if (!started) return started.failure();
  auto program = std::move(started).value();
  if (!program.endsBefore(RunLoop::Clock::now() + longestRun, runLoop)) return outOfTime(words);
  ::lseek(output.number(), 0, SEEK_SET);
  auto printed = readBeginning(output, outputLimit, words.front());
  if (!printed) return printed.failure();
  return EndedProgram{program.status(), std::move(printed).value()};
}

}  // namespace

Result<RunningProgram> RunningProgram::start(const SystemRoot& root, std::vector<std::string> words,
                                             const ProgramFiles& files) {
  const auto program = root.standardized(words.front());
  if (!program) return program.failure();
  const auto path = root.prefix() == "/" ? *program : root.prefix() + *program;
  std::vector<std::string> environment = {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C"};
  const SpawnSetup setup(files);
  pid_t id = 0;
  const int error = ::posix_spawn(&id, path.c_str(), setup.actions(), setup.attributes(), pointersTo(words).data(),
                                  pointersTo(environment).data());
  if (error != 0) return systemFailure("run", words.front(), error);
  RunningProgram running(id);
  // Without one nobody is woken at the end of the program, which then is found out after its time.
  if (auto handle = ProcessHandle::of(id)) running._handle = std::move(handle).value();
  return running;
}

RunningProgram::RunningProgram(RunningProgram&& other) noexcept
    : _id(other._id),
      _handle(std::move(other._handle)),
      _status(other._status),
      _hasEnded(std::exchange(other._hasEnded, true)) {}

RunningProgram& RunningProgram::operator=(RunningProgram&& other) noexcept {
  std::swap(_id, other._id);
  std::swap(_handle, other._handle);
  std::swap(_status, other._status);
  std::swap(_hasEnded, other._hasEnded);
  return *this;
}

RunningProgram::~RunningProgram() {
  if (hasEnded()) return;
  ::kill(_id, SIGKILL);
  ::waitpid(_id, nullptr, 0);
}

bool RunningProgram::hasEnded() {
  _hasEnded = _hasEnded || ::waitpid(_id, &_status, WNOHANG) == _id;
  return _hasEnded;
}

bool RunningProgram::endsBefore(RunLoop::Clock::time_point deadline, RunLoop& runLoop) {
  const auto watching = runLoop.watch(_handle.descriptor(), RunLoop::Readiness::readable, [] {});
  return runLoop.runUntil(deadline, [this] { return hasEnded(); });
}

Result<std::string> runProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  const auto ended = runToEnd(root, words, runLoop);
  if (!ended) return ended.failure();
  if (ended->status != 0) return Failure{"run", words.front(), howItEnded(ended->status) + lastLine(ended->printed)};
  return ended->printed;
}

Result<ProgramOutput> outputOfProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  const auto ended = runToEnd(root, words, runLoop);
  if (!ended) return ended.failure();
  if (WIFSIGNALED(ended->status)) return Failure{"run", words.front(), howItEnded(ended->status)};
  return ProgramOutput{WEXITSTATUS(ended->status), ended->printed};
}

}  // namespace tavisk
