// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <elf.h>
#include <fcntl.h>
#include <sys/ptrace.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <sys/user.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdint>
#include <functional>

namespace tavisk {

/// Which system call a traced process is about to make; op is another than ENTRY when it makes none.
inline __ptrace_syscall_info callOf(pid_t process) {
  __ptrace_syscall_info call{};
  ::ptrace(PTRACE_GET_SYSCALL_INFO, process, sizeof call, &call);
  return call;
}

inline bool isOneOf(const __ptrace_syscall_info& call, std::initializer_list<std::uint64_t> numbers) {
  return call.op == PTRACE_SYSCALL_INFO_ENTRY && std::ranges::find(numbers, call.entry.nr) != numbers.end();
}

/// Whether the call that the process is about to make may change a file.
inline bool mayChangeFiles(pid_t process) {
  const auto call = callOf(process);
  if (isOneOf(call, {SYS_openat2})) return (::ptrace(PTRACE_PEEKDATA, process, call.entry.args[2], 0) & O_ACCMODE) != 0;
  return isOneOf(call, {SYS_write, SYS_pwrite64, SYS_unlinkat, SYS_renameat, SYS_renameat2, SYS_ftruncate, SYS_mkdirat,
                        SYS_fsync, SYS_ioctl});
}

/// Whether the call looks for a file or a folder, or may change one.
inline bool opensOrChangesFiles(pid_t process) {
  return mayChangeFiles(process) || isOneOf(callOf(process), {SYS_openat2});
}

inline user_regs_struct registersOf(pid_t process) {
  user_regs_struct registers{};
  iovec area{&registers, sizeof registers};
  ::ptrace(PTRACE_GETREGSET, process, NT_PRSTATUS, &area);
  return registers;
}

inline void setRegisters(pid_t process, user_regs_struct registers) {
  iovec area{&registers, sizeof registers};
  ::ptrace(PTRACE_SETREGSET, process, NT_PRSTATUS, &area);
}

#if defined(__x86_64__)
inline void setCall(pid_t process, int number) {
  auto registers = registersOf(process);
  registers.orig_rax = static_cast<unsigned long long>(number);
  setRegisters(process, registers);
}

inline void setAnswer(pid_t process, int answer) {
  auto registers = registersOf(process);
  registers.rax = static_cast<unsigned long long>(answer);
  setRegisters(process, registers);
}
#elif defined(__aarch64__)
inline void setCall(pid_t process, int number) {
  iovec area{&number, sizeof number};
  ::ptrace(PTRACE_SETREGSET, process, NT_ARM_SYSTEM_CALL, &area);
}

inline void setAnswer(pid_t process, int answer) {
  auto registers = registersOf(process);
  registers.regs[0] = static_cast<unsigned long long>(answer);
  setRegisters(process, registers);
}
#endif

/// Whether this machine has calls traced: one that is emulated has not.
inline bool canTraceCalls() {
  const auto child = ::fork();
  if (child == 0) ::_exit(::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr) == 0 ? 0 : 1);
  int status = 0;
  ::waitpid(child, &status, 0);
  return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

/// A run in a process of its own in which one call went wrong.
struct TracedRun {
  bool wentWrong = false;  ///< false: there were not so many calls before the first that was to
  int status = -1;         ///< what the work returned; -1: it was killed
};

/// The work's call of that number among the chosen ones, and so many calls of them after it, fail with the error; with
/// error 0 that is where it is killed.
inline TracedRun runWithFault(int number, int error, bool (*isChosen)(pid_t), const std::function<int()>& work,
                              int furtherFaults = 0) {
  const auto child = ::fork();
  if (child == 0) {
    ::ptrace(PTRACE_TRACEME, 0, nullptr, nullptr);
    ::raise(SIGSTOP);
    ::_exit(work());
  }
  int status = 0;
  const auto resume = [&](auto request) {
    ::ptrace(request, child, nullptr, nullptr);
    ::waitpid(child, &status, 0);
  };
  ::waitpid(child, &status, 0);
  ::ptrace(PTRACE_SETOPTIONS, child, nullptr, PTRACE_O_TRACESYSGOOD | PTRACE_O_EXITKILL);
  const auto goToCall = [&](int which) {
    while (WIFSTOPPED(status) && (!isChosen(child) || --which >= 0)) resume(PTRACE_SYSCALL);
    return WIFSTOPPED(status);
  };
  const bool wentWrong = goToCall(number);
  if (wentWrong && error == 0) {
    ::kill(child, SIGKILL);
    ::waitpid(child, &status, 0);
  }
  for (int faults = 0; faults <= furtherFaults && goToCall(0); ++faults) {
    setCall(child, -1);  // none
    resume(PTRACE_SYSCALL);
    setAnswer(child, -error);
    resume(PTRACE_SYSCALL);
  }
  if (WIFSTOPPED(status)) resume(PTRACE_CONT);
  return {wentWrong, WIFEXITED(status) ? WEXITSTATUS(status) : -1};
}

}  // namespace tavisk
