// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <algorithm>

#include "ToolRun.h"

namespace tavisk {

namespace {

using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::StartsWith;

TEST(Help, tellsEveryCommandAndNoMore) {
  ScratchMachine machine;
  const std::string help = runTool(machine, {"-help"}).output;
  EXPECT_THAT(help, StartsWith("\ntavisk Help Information\n-------------------------------------\n"
                               "Usage: tavisk -getdate\n\tDisplay current date.\n\n"
                               "Usage: tavisk -setdate <mm:dd:yy>\n\tSet current date to <mm:dd:yy>.\n\n"));
  EXPECT_THAT(help, HasSubstr("\n\nUsage: tavisk -setcomputersleep <minutes>\n"
                              "\tSet amount of idle time until compputer sleeps to <minutes>.\n"
                              "\tSpecify \"Never\" or \"Off\" for never.\n\n"
                              "Usage: tavisk -getdisplaysleep\n"));
  EXPECT_THAT(help, HasSubstr("\nUsage: tavisk -setdisablekeyboardwhenenclosurelockisengaged <yes no>\n"
                              " \tSet whether or not the keyboard should be disabled when the Dunmere enclosure lock "
                              "is engaged.\n\n"));
  EXPECT_THAT(help, EndsWith("\tDisplay help.\n\nUsage: tavisk -printCommands\n\tDisplay commands.\n"));
  EXPECT_EQ(std::count(help.begin(), help.end(), '\n'), 3 + 47 * 3 + 4 - 1);
}

TEST(Help, listsTheCommands) {
  ScratchMachine machine;
  const std::string list = runTool(machine, {"-printCommands"}).output;
  EXPECT_THAT(list, StartsWith("tavisk -getdate\ntavisk -setdate <mm:dd:yy>\n"));
  EXPECT_THAT(list, EndsWith("\ntavisk -version\ntavisk -help\ntavisk -printCommands\n"));
  EXPECT_EQ(std::count(list.begin(), list.end(), '\n'), 47);
}

}  // namespace

}  // namespace tavisk
