// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchProcesses.h"

#include <utility>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* signals = "Signals";

constexpr const char* nvram = "/usr/sbin/nvram";

void append(MachineFile::Dictionary& machine, int signal, ProcessId process) {
  PropertyList::Dictionary entry;
  entry.set("Process", process);
  entry.set("Signal", signal);
  const auto* sent = machine.find(signals);
  auto entries = sent ? *sent->asArray() : PropertyList::Array();
  entries.push_back(std::move(entry));
  machine.set(signals, std::move(entries));
}

}  // namespace

ProcessId ScratchProcessUtilities::processNamed(const std::string& name) {
  const auto processes = _settings.section("Processes");
  const auto* process = processes.find(name);
  const auto id = process ? *process->asInteger() : 0;
  return std::in_range<ProcessId>(id) ? static_cast<ProcessId>(id) : 0;
}

void ScratchProcessUtilities::sendSignal(int signal, ProcessId process) {
  const MachineSetting<std::string> sent{
      setting::signalToProcess, "", nullptr,
      [=](MachineFile::Dictionary& machine, const std::string&) { append(machine, signal, process); }};
  _settings.change(sent, std::to_string(signal) + " to process " + std::to_string(process));
}

void ScratchProcessUtilities::setLockEnclosureState(bool disablesKeyboard) {
  _settings.change(keyboardsDisabled(), disablesKeyboard);
}

Result<ProgramOutput> ScratchProgramRunner::run(const std::string& program, const std::vector<std::string>& arguments) {
  if (program != nvram) return Failure{"run", program, "no such program on the rehearsed machine"};
  const auto variables = _machine.section("Firmware").section("Variables");
  ProgramOutput output;
  for (const auto& name : arguments) {
    const auto value = variables.optionalText(name);
    if (!value) return ProgramOutput{1, ""};
    output.text += name + "\t" + *value + "\n";
  }
  return output;
}

}  // namespace tavisk
