// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ToolRun.h"
#include "frontend/CommandList.h"

namespace tavisk {
namespace {

constexpr const char* machineWithAllSwitches =
    "<dict><key>Power Sources</key><dict><key>AC Power</key><dict>"
    "<key>Wake On Ring</key><true/><key>Wake On LAN</key><true/><key>Auto Restart</key><true/>"
    "<key>Power Button Sleep</key><true/></dict></dict></dict>";

TEST(CommandList, offersWordsThatTheCommandsAccept) {
  for (const auto& command : listCommands()) {
    for (const auto word : fixedValues(command.argument)) {
      ScratchMachine machine;
      machine.describe(machineWithAllSwitches);
      const auto run = runTool(machine, {"-f", command.word, std::string(word)});
      EXPECT_EQ(run.status, 0) << run.output;
      for (const char* refusal : {"Error", "Invalid", "Not supported"})
        EXPECT_THAT(run.output, testing::Not(testing::HasSubstr(refusal))) << command.word;
    }
  }
}

}  // namespace
}  // namespace tavisk
