// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxProcessUtilities.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

#include "platform/SettingChange.h"
#include "platform/SettingNames.h"
#include "platform/SystemFailure.h"
#include "platform/linux/ProcessScan.h"

namespace tavisk {
namespace {

constexpr const char* tried = "send signal";

}  // namespace

ProcessId LinuxProcessUtilities::processNamed(const std::string& name) {
  const auto found = processesNamed(_machine.root, name);
  return found.empty() ? 0 : *std::ranges::min_element(found);
}

void LinuxProcessUtilities::sendSignal(int signal, ProcessId process) {
  Setting setting;
  setting.name = setting::signalToProcess;
  setting.apply = [&](const std::string&) { return signalProcess(signal, process); };
  carryOut(setting, std::to_string(signal) + " to process " + std::to_string(process), _machine.effects,
           _machine.runLoop);
}

Result<void> LinuxProcessUtilities::signalProcess(int signal, ProcessId process) const {
  const auto name = "process " + std::to_string(process);
  if (process < 1) return Failure{tried, name, "this is no process id"};
  // The ids in a tree may be those of strangers on the machine that runs the tool.
  if (_machine.root.prefix() != "/") return Failure{tried, name, "a tree of files has no processes"};
  const FileDescriptor handle(static_cast<int>(::syscall(SYS_pidfd_open, process, 0)));
  if (!handle) return systemFailure(tried, name, errno);
  if (::syscall(SYS_pidfd_send_signal, handle.number(), signal, nullptr, 0) == 0) return {};
  const int error = errno;
  const auto forRoot = error == EPERM ? whyNeedsRoot(tried, name) : std::nullopt;
  return forRoot.value_or(systemFailure(tried, name, error));
}

}  // namespace tavisk
