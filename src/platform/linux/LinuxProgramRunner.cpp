// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxProgramRunner.h"

#include "platform/linux/Program.h"

namespace tavisk {

Result<ProgramOutput> LinuxProgramRunner::run(const std::string& program, const std::vector<std::string>& arguments) {
  if (!_machine.root.exists(program)) return Failure{"run", program, "no such program"};
  std::vector<std::string> words{program};
  words.insert(words.end(), arguments.begin(), arguments.end());
  return outputOfProgram(_machine.root, words, _machine.runLoop);
}

}  // namespace tavisk
