// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {
namespace {

struct MachineWithRemoteLogin : ScratchMachine {
  MachineWithRemoteLogin() { set("Remote Shell", "Enabled", true); }
};

TEST(RemoteLogin, takesAnAnswerOfMoreThan1023CharactersForSeveral) {
  const std::string piece(1023, 'x');
  for (const auto& [typed, turnedOff] :
       {std::pair(piece + "yes\nno\n", true), std::pair(piece.substr(1) + "\nno\nyes\n", false)}) {
    MachineWithRemoteLogin machine;
    runTool(machine, {"-setremotelogin", "off"}, {.typed = typed});
    EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(!turnedOff));
  }
}

TEST(RemoteLogin, keepsAskingAtTheEndOfTheInputUntilTheOutputIsLost) {
  MachineWithRemoteLogin machine;
  const Stream full(std::fopen("/dev/full", "w"));
  const auto result = runTool(machine, {"-setremotelogin", "off"}, {.output = full.get()});
  EXPECT_EQ(result.status, 1);
  EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(true));
}

}  // namespace
}  // namespace tavisk
