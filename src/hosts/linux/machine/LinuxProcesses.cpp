// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/LinuxProcesses.h"

#include <algorithm>

#include "base/FileDescriptor.h"
#include "effects/SettingNames.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/ProcessHandle.h"
#include "hosts/linux/system/ProcessScan.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

constexpr const char* tried = "send signal";

}  // namespace

ProcessId LinuxProcessUtilities::processNamed(const std::string& name) {
  const auto found = processesNamed(_machine.root, name);
  if (!found) _machine.effects.recordFailure(setting::signalToProcess, found.failure());
  return !found || found->empty() ? 0 : *std::ranges::min_element(*found);
}

void LinuxProcessUtilities::sendSignal(int signal, ProcessId process) {
  Setting<std::string> setting;
  setting.name = setting::signalToProcess;
  setting.apply = [&](const std::string&) { return signalProcess(signal, process); };
  carryOut(setting, std::to_string(signal) + " to process " + std::to_string(process), _machine);
}

Result<void> LinuxProcessUtilities::signalProcess(int signal, ProcessId process) const {
  const auto name = "process " + std::to_string(process);
  if (process < 1) return Failure{tried, name, "this is no process id"};
  // The ids in a tree may be those of strangers on the machine that runs the tool.
  if (_machine.root.prefix() != "/") return Failure{tried, name, "a tree of files has no processes"};
  const auto handle = ProcessHandle::of(process);
  if (!handle) return retold(handle.failure(), tried, name);
  const auto sent = handle->send(signal);
  if (sent) return {};
  const bool isForbidden = sent.failure().code == std::errc::operation_not_permitted;
  const auto forRoot = isForbidden ? whyNeedsRoot(tried, name) : std::nullopt;
  return forRoot.value_or(retold(sent.failure(), tried, name));
}

void LinuxProcessTermination::disable() {
  if (_holds++ > 0) return;
  auto hold = delayShutdown();
  if (!hold) return _machine.effects.recordFailure(setting::startupDisk, hold.failure());
  _hold = std::move(hold).value();
}

Result<FileDescriptor> LinuxProcessTermination::delayShutdown() {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return retold(bus.failure(), "delay a shutdown", bus.failure().on);
  if (!*bus) return FileDescriptor();
  auto hold =
      (*bus)->call(loginManager(), "Inhibit", "h", "shutdown", "tavisk", "The startup disk is being set", "delay");
  if (hold) return std::move(hold).value().readDescriptor();
  if (hold.failure().code == BusErrorCode::serviceUnknown) return FileDescriptor();
  return hold.failure();
}

void LinuxProcessTermination::enable() {
  if (_holds > 0 && --_holds == 0) _hold = FileDescriptor();
}

Result<ProgramOutput> LinuxProgramRunner::run(const std::string& program, const std::vector<std::string>& arguments) {
  const auto isThere = _machine.root.isThere(program);
  if (!isThere) return retold(isThere.failure(), "run", program);
  if (!*isThere) return Failure{"run", program, "no such program"};
  std::vector<std::string> words{program};
  words.insert(words.end(), arguments.begin(), arguments.end());
  return outputOfProgram(_machine.root, words, _machine.runLoop);
}

}  // namespace tavisk
