// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {
namespace {

const std::string banner = "> tavisk\n> type -help for help.\n> ";
const std::string endOfInput = "Error: fgets returned NULL.\n";

std::string answersTo(std::string_view typed) {
  ScratchMachine machine;
  machine.set("Clock", "Time", 1173301503);
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
