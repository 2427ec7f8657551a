// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {
namespace {

struct MachineInUtc : ScratchMachine {
  MachineInUtc() { set("Clock", "Time", 1173301503); }
};

std::string tableOf(const std::string& selector, const std::string& count) {
  return "<dict><key>-word</key><dict><key>selector</key><string>" + selector +
         "</string><key>arguments</key><integer>" + count +
         "</integer></dict><key>-getdate</key><dict><key>selector</key><string>getDate</string>"
         "<key>arguments</key><integer>0</integer></dict></dict>";
}

TEST(Dispatch, takesAsManyArgumentsAsTheTableSays) {
  const std::string usage = "settime: Error, you must specify a valid time. Command usage: 'settime <hh:mm:ss>'\n";
  const std::tuple<const char*, const char*, std::vector<std::string>, std::string> cases[] = {
      {"getTime", "0", {"word", "getdate"}, "Time: 21:05:03\nDate: 3/7/2007\n"},
      {"getTime", "1", {"word", "bogus", "getdate"}, "Time: 21:05:03\nDate: 3/7/2007\n"},
      {"setTime:", "2", {"word", "1:2:3", "bogus", "getdate"}, "Set Time: 01:02:03\nDate: 3/7/2007\n"},
      {"setTime:", "2", {"word", "1:2:3"}, "Set Time: 01:02:03\n"},
      {"setTime:", "1", {"word", "-f"}, "Set Time: 00:00:00\n"},
      {"setTime:", "0", {"word"}, usage},
  };
  for (const auto& [selector, count, words, output] : cases) {
    SCOPED_TRACE(std::string(selector) + " " + count);
    MachineInUtc machine;
    const auto table = tableOf(selector, count);
    EXPECT_EQ(runTool(machine, words, {.commandTable = table}).output, output);
  }
}

TEST(Dispatch, repeatsAnInvalidCountUntilNobodyListens) {
  for (const char* count : {"3", "-1"}) {
    MachineInUtc machine;
    const auto table = tableOf("getTime", count);
    const Stream output(std::fopen("/dev/full", "w"));
    ::testing::internal::CaptureStderr();
    const auto result = runTool(machine, {"word", "getdate"}, {.commandTable = table, .output = output.get()});
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "tavisk: standard output: No space left on device\n");
    EXPECT_EQ(result.status, 1);
  }
}

TEST(Dispatch, needsItsCommandTable) {
  const std::string untranslated = "Error: Command info could not be translated.\n";
  const std::pair<std::string_view, std::string> cases[] = {
      {{}, "Error: Command info could not be found.\n"},
      {"", untranslated},
      {"<dict>", untranslated},
      {"<array/>", untranslated},
      {"<dict><key>-getdate</key><string>getDate</string></dict>", untranslated},
      {"<dict><key>-getdate</key><dict><key>selector</key><string>getDate</string></dict></dict>", untranslated},
  };
  for (const auto& [table, output] : cases) {
    ScratchMachine machine;
    const auto result = runTool(machine, {"-gettimezone"}, {.commandTable = table});
    EXPECT_EQ(result.output, output);
    EXPECT_EQ(result.status, 0);
  }
}

const std::string banner = "> tavisk\n> type -help for help.\n> ";
const std::string endOfInput = "Error: fgets returned NULL.\n";

std::string answersTo(std::string_view typed) {
  MachineInUtc machine;
  return runTool(machine, {}, {.typed = typed}).output;
}

TEST(InteractiveMode, takesLongLinesInPieces) {
  const std::string whole(2040, ' ');
  const auto line = [&](const std::string& end) { return whole + end + "\n"; };
  // 2055 bytes with the newline fit; of one more, the newline is a line of its own, and the last character is lost.
  EXPECT_EQ(answersTo(line("      -getdate")), banner + "Date: 3/7/2007\n> " + endOfInput);
  EXPECT_EQ(answersTo(line("       -getdate")), banner + "Error: -getdat is not a valid command\n> > " + endOfInput);
  EXPECT_EQ(answersTo(line("      -getdateXgettime")), banner + "Date: 3/7/2007\n> Time: 21:05:03\n> " + endOfInput);
}

}  // namespace
}  // namespace tavisk
