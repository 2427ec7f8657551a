// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <map>

#include "ToolRun.h"
#include "frontend/CommandList.h"
#include "frontend/CommandTable.h"

namespace tavisk {
namespace {

TEST(CommandList, hasTheCommandsOfTheTableAndTheirArguments) {
  std::map<std::string, std::int64_t> listed, inTable;
  for (const ListedCommand& command : listCommands())
    listed[command.word] = command.argument == ArgumentKind::none ? 0 : 1;
  const auto table = CommandTable::parse(CommandTable::text());
  for (const auto& [word, entry] : table->entries()) inTable[word] = entry.arguments;
  EXPECT_EQ(listed, inTable);
}

constexpr const char* machineWithAllSwitches =
    "<dict><key>Power Sources</key><dict><key>AC Power</key><dict>"
    "<key>Wake On Ring</key><true/><key>Wake On LAN</key><true/><key>Auto Restart</key><true/>"
    "</dict></dict></dict>";

TEST(CommandList, offersWordsThatTheCommandsAccept) {
  for (const ListedCommand& command : listCommands()) {
    for (const std::string_view word : fixedValues(command.argument)) {
      ScratchMachine machine;
      machine.describe(machineWithAllSwitches);
      const auto run = runTool(machine, {"-f", command.word, std::string(word)});
      EXPECT_EQ(run.status, 0) << run.output;
      EXPECT_EQ(run.output.find("Invalid"), std::string::npos) << run.output;
    }
  }
}

}  // namespace
}  // namespace tavisk
