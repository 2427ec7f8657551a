// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ProgramRunner.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

class LinuxProgramRunner final : public ProgramRunner {
 public:
  explicit LinuxProgramRunner(const LinuxMachine& machine) : _machine(machine) {}

  Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) override;

 private:
  const LinuxMachine& _machine;
};

}  // namespace tavisk
