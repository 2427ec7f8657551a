// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchProgramRunner.h"

namespace tavisk {

Result<ProgramOutput> ScratchProgramRunner::run(const std::string& program, const std::vector<std::string>& arguments) {
  if (program != "/usr/sbin/nvram") return Failure{"run", program, "no such program on the rehearsed machine"};
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
