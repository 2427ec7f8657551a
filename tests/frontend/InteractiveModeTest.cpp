// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {

namespace {

using namespace std::string_view_literals;

const std::string banner = "> tavisk\n> type -help for help.\n> ";
const std::string endOfInput = "Error: fgets returned NULL.\n";

ToolResult type(std::string_view typed) {
  ScratchMachine machine;
  machine.set("Clock", "Time", 1173301503);
  return runTool(machine, {}, {.typed = typed});
}

TEST(InteractiveMode, answersLineByLine) {
  struct Case {
    std::string_view typed;
    std::string output;
    int status;
  };
  const std::string bufferIsNull = "Error, buffer == NULL\n> ";
  const std::string date = "Date: 3/7/2007\n";
  const Case cases[] = {
      {"", endOfInput, 0},
      {"-getdate\n", date + "> " + endOfInput, 0},
      {"getdate gettime\nexit\n", date + "Time: 21:05:03\n> ", 0},
      {"  getdate   gettime  \nQuit\n", date + "Time: 21:05:03\n> ", 0},
      {"\nEXIT now\n-getdate\n", "> ", 0},
      {"quitter\n", "", 0},
      {"exi\n quit\nexit", "Error: exi is not a valid command\n> Error: quit is not a valid command\n> ", 0},
      {"   \n", bufferIsNull + endOfInput, 0},
      {" ", bufferIsNull + endOfInput, 0},
      {"-settimezone My Server\n-getdate\n",
       "My is not a valid timezone. The command 'listtimezones' will show a list of valid time zones.\n"
       "Error: Server is not a valid command\n> " +
           date + "> " + endOfInput,
       0},
      {"-settime 99\nquit\n", "settime: Error, 99 is invalid time format... use hh:mm:ss\n> ", 1},
      {"-getdate\t-gettime\n", "Error: -getdate\t-gettime is not a valid command\n> " + endOfInput, 0},
      {"-getdate\r\n", "Error: -getdate\r is not a valid command\n> " + endOfInput, 0},
      // The last character goes, whatever it is.
      {"-getdateX", date + "> " + endOfInput, 0},
      {"-getdate", "Error: -getdat is not a valid command\n> " + endOfInput, 0},
      {"\0-getdate\n"sv, bufferIsNull + endOfInput, 0},
      {"-getdateX\0 -gettime\n-gettime\n"sv, date + "> Time: 21:05:03\n> " + endOfInput, 0},
      {"-getdate \xff -gettime\n", date + "Error: \xff is not a valid command\n> " + endOfInput, 0},
      {"-f -getdate\n-f\n", date + "> > " + endOfInput, 0},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.typed);
    const auto result = type(test.typed);
    EXPECT_EQ(result.output, banner + test.output);
    EXPECT_EQ(result.status, test.status);
  }
}

TEST(InteractiveMode, takesLongLinesInPieces) {
  const std::string whole(2040, ' ');
  const auto line = [&](const std::string& end) { return whole + end + "\n"; };
  // 2055 bytes with the newline fit; of one more, the newline is a line of its own, and the last character is lost.
  EXPECT_EQ(type(line("      -getdate")).output, banner + "Date: 3/7/2007\n> " + endOfInput);
  EXPECT_EQ(type(line("       -getdate")).output, banner + "Error: -getdat is not a valid command\n> > " + endOfInput);
  EXPECT_EQ(type(line("      -getdateXgettime")).output, banner + "Date: 3/7/2007\n> Time: 21:05:03\n> " + endOfInput);
}

TEST(InteractiveMode, passesTheRunLoopOnceAfterEachLine) {
  ScratchMachine machine;
  int passes = 0;
  std::function<void()> countPass = [&] {
    ++passes;
    machine.runLoop.post(countPass);
  };
  machine.runLoop.post(countPass);
  runTool(machine, {}, {.typed = "\n-gettimezone\n \nquit\n"});
  // The first one is the pass in which the run itself sits.
  EXPECT_EQ(passes, 1 + 3);
}

}  // namespace

}  // namespace tavisk
