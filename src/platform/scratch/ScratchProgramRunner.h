// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ProgramRunner.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// The only program of the machine is /usr/sbin/nvram, which prints a firmware variable.
class ScratchProgramRunner final : public ProgramRunner {
 public:
  explicit ScratchProgramRunner(MachineFile& machine) : _machine(machine) {}

  Result<ProgramOutput> run(const std::string& program, const std::vector<std::string>& arguments) override;

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
