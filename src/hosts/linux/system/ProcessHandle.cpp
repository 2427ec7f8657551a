// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ProcessHandle.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <string>

namespace tavisk {
namespace {

Failure processFailure(const char* tried, ProcessId process, int error) {
  return systemFailure(tried, "process " + std::to_string(process), error);
}

}  // namespace

Result<ProcessHandle> ProcessHandle::of(ProcessId process) {
  FileDescriptor file(static_cast<int>(::syscall(SYS_pidfd_open, process, 0)));
  if (!file) return processFailure("pidfd_open", process, errno);
  return ProcessHandle(process, std::move(file));
}

Result<void> ProcessHandle::send(int signal) const {
  if (::syscall(SYS_pidfd_send_signal, _file.number(), signal, nullptr, 0) == 0) return {};
  return processFailure("pidfd_send_signal", _process, errno);
}

}  // namespace tavisk
