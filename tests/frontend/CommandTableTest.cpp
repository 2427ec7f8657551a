// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <set>

#include "ToolRun.h"
#include "frontend/CommandList.h"
#include "frontend/CommandTable.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/Help.h"

namespace tavisk {
namespace {

CommandTable productTable() {
  return CommandTable::parse(CommandTable::text()).value();
}

TEST(HandlerRegistry, agreesWithTheCommandTable) {
  const auto table = productTable();
  std::multiset<std::string> expected;
  for (const auto& family : handlerFamilies()) {
    for (const auto& row : family) expected.emplace(row.selector);
  }
  std::multiset<std::string> selectors;
  for (const auto& [word, entry] : table.entries()) {
    selectors.insert(entry.selector);
    EXPECT_EQ(entry.arguments, entry.selector.ends_with(':') ? 1 : 0) << word;
    EXPECT_EQ(static_cast<std::int64_t>(handlerNamed(entry.selector).index()), entry.arguments) << word;
  }
  EXPECT_EQ(selectors.size(), 49U);
  EXPECT_EQ(selectors, expected);
}

TEST(HandlerRegistry, agreesWithTheHelp) {
  const auto table = productTable();
  std::set<std::string> untold;
  for (const auto& [word, entry] : table.entries()) untold.insert(word);
  for (const auto& entry : helpEntries()) {
    std::string word = entry.word;
    if (word == "-printCommands") word = "-printcommands";
    const auto* row = table.find(word);
    ASSERT_TRUE(row) << word;
    EXPECT_EQ(*entry.placeholder != '\0', row->arguments == 1) << word;
    EXPECT_EQ(untold.erase(word), 1U) << word;
  }
  EXPECT_THAT(untold, ::testing::ElementsAre("-getkernelbootarchitecturesetting", "-setkernelbootarchitecture"));
}

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
