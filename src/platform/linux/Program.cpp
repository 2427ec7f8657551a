// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/Program.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>

#include "platform/FileContents.h"
#include "platform/SystemFailure.h"
#include "platform/Text.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestRun{10};
constexpr std::size_t outputLimit = 65536;

/// The attributes and file actions of posix_spawn(3).
class SpawnSetup {
 public:
  explicit SpawnSetup(int output) {
    ::posix_spawnattr_init(&_attributes);
    ::posix_spawn_file_actions_init(&_actions);
    sigset_t none;
    ::sigemptyset(&none);
    ::posix_spawnattr_setsigmask(&_attributes, &none);
    sigset_t ignored;
    ::sigemptyset(&ignored);
    ::sigaddset(&ignored, SIGPIPE);
    ::posix_spawnattr_setsigdefault(&_attributes, &ignored);
    ::posix_spawnattr_setflags(&_attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    ::posix_spawn_file_actions_addopen(&_actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    ::posix_spawn_file_actions_adddup2(&_actions, output, STDOUT_FILENO);
    ::posix_spawn_file_actions_adddup2(&_actions, output, STDERR_FILENO);
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
  posix_spawnattr_t _attributes{};
  posix_spawn_file_actions_t _actions{};
};

/// A started program; one that is still running at the end of this object is killed.
class Child {
 public:
  explicit Child(pid_t id) : _id(id), _handle(static_cast<int>(::syscall(SYS_pidfd_open, id, 0))) {}
  Child(const Child&) = delete;
  Child& operator=(const Child&) = delete;
  ~Child() {
    if (_ended) return;
    ::kill(_id, SIGKILL);
    ::waitpid(_id, nullptr, 0);
  }

  bool endsBefore(RunLoop::Clock::time_point deadline, RunLoop& runLoop) {
    auto watching = runLoop.watch(_handle.number(), RunLoop::Readiness::readable, [] {});
    return runLoop.runUntil(deadline, [this] { return hasEnded(); });
  }
  int status() const { return _status; }

 private:
  bool hasEnded() {
    _ended = _ended || ::waitpid(_id, &_status, WNOHANG) == _id;
    return _ended;
  }

  pid_t _id;
  FileDescriptor _handle;
  int _status = 0;
  bool _ended = false;
};

std::vector<char*> pointersTo(std::vector<std::string>& words) {
  std::vector<char*> pointers;
  for (auto& word : words) pointers.push_back(word.data());
  pointers.push_back(nullptr);
  return pointers;
}

/// The program in the root's tree; execve(2) needs a path, and /proc names the open file.
Result<pid_t> spawn(const SystemRoot& root, std::vector<std::string> words, int output) {
  auto program = root.standardized(words.front());
  if (!program) return program.failure();
  auto path = root.prefix() == "/" ? *program : root.prefix() + *program;
  std::vector<std::string> environment = {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C"};
  SpawnSetup setup(output);
  pid_t id = 0;
  int error = ::posix_spawn(&id, path.c_str(), setup.actions(), setup.attributes(), pointersTo(words).data(),
                            pointersTo(environment).data());
  if (error != 0) return systemFailure("run", words.front(), error);
  return id;
}

std::string lastLine(const std::string& text) {
  auto lines = split(text, "\r\n");
  return lines.empty() ? std::string() : ": " + lines.back();
}

std::string ended(int status) {
  if (WIFSIGNALED(status)) return "it was ended by signal " + std::to_string(WTERMSIG(status));
  return "it ended with status " + std::to_string(WEXITSTATUS(status));
}

}  // namespace

Result<std::string> runProgram(const SystemRoot& root, const std::vector<std::string>& words, RunLoop& runLoop) {
  // A file in memory, not a pipe: a daemon that the program leaves behind may keep it open.
  FileDescriptor output(::memfd_create("output", MFD_CLOEXEC));
  if (!output) return systemFailure("memfd_create", words.front(), errno);
  auto id = spawn(root, words, output.number());
  if (!id) return id.failure();
  Child child(*id);
  if (!child.endsBefore(RunLoop::Clock::now() + longestRun, runLoop))
    return Failure{"run", words.front(), "it has not ended in time"};
  ::lseek(output.number(), 0, SEEK_SET);
  auto printed = readAll(output, outputLimit, words.front()).valueOr("");
  if (child.status() != 0) return Failure{"run", words.front(), ended(child.status()) + lastLine(printed)};
  return printed;
}

}  // namespace tavisk
