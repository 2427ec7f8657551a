// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <map>

#include "ToolRun.h"
#include "frontend/ArgumentKinds.h"

namespace tavisk {

namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr const char* machineWithEverySwitch =
    "<plist><dict><key>Power Sources</key><dict><key>AC Power</key><dict>"
    "<key>Wake On Ring</key><false/><key>Wake On LAN</key><false/><key>Auto Restart</key><false/>"
    "<key>Power Button Sleep</key><false/></dict></dict></dict></plist>";

TEST(ArgumentKinds, commandsTakeTheWordsThatAreOffered) {
  std::map<ArgumentKind, int> commands;
  for (const HelpEntry& entry : helpEntries()) {
    const ArgumentKind kind = argumentKind(entry);
    ++commands[kind];
    for (const std::string_view value : fixedValues(kind)) {
      ScratchMachine machine;
      machine.describe(machineWithEverySwitch);
      const ToolResult result = runTool(machine, {"-f", entry.word, std::string(value)});
      EXPECT_EQ(result.status, 0) << entry.word << ' ' << value;
      EXPECT_THAT(result.output, AllOf(Not(HasSubstr("Error")), Not(HasSubstr("Invalid")))) << entry.word;
    }
  }
  EXPECT_EQ(commands[ArgumentKind::onOff], 8);
  EXPECT_EQ(commands[ArgumentKind::yesNo], 1);
  EXPECT_EQ(commands[ArgumentKind::minutes], 4);
  EXPECT_EQ(commands[ArgumentKind::timeZone], 1);
  EXPECT_EQ(commands[ArgumentKind::startupDisk], 1);
}

}  // namespace

}  // namespace tavisk
